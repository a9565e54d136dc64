#ifndef VORN_NETWORK_MODULE_MODULE_TYPE_H
#define VORN_NETWORK_MODULE_MODULE_TYPE_H

#include <cstdint>

namespace vornnetwork {
namespace network {
namespace module {

enum MODULE_TYPE : std::int32_t {
    MODULE_TEST = 1,
    MODULE_IPV6 = 2,
    MODULE_ROUTE = 3,
    MODULE_DEVICE_LIST = 4,
    MODULE_NETLINK = 5,
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
