#include "wifi/adapter/adapter.h"

#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {

WIFI_TOPOLOGY Adapter::topology_ = WIFI_TOPOLOGY_ERROR;

WIFI_TOPOLOGY Adapter::GetTopology() {
    if (topology_ == WIFI_TOPOLOGY_ERROR) {
        topology_ = utils::ReadTopology();
    }
    return topology_;
}

void Adapter::SwitchTopology(WIFI_TOPOLOGY topology) {
    topology_ = topology;
}

}  // namespace wifi
}  // namespace vornwireless
