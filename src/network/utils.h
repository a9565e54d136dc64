#ifndef VORN_NETWORK_UTILS_H
#define VORN_NETWORK_UTILS_H

#include <string>

namespace vornnetwork {
namespace network {

// Whether ethtool reports a cable on the interface. Only a clear "no" counts as unplugged: empty
// output (unknown interface, no ethtool) counts as linked. False for a name that is not a valid
// interface name or when the command cannot run.
bool IsEthernetLinkDetected(const std::string& ifname);

}  // namespace network
}  // namespace vornnetwork

#endif
