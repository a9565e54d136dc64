#include "wifi/settings/adapter_capability_kite_model.h"

namespace vornwireless {
namespace wifi {

std::vector<WIFI_FEATURE> AllFeatures() {
    return {WIFI_FEATURE_MAC_FILTER, WIFI_FEATURE_GUEST_NETWORK, WIFI_FEATURE_PARENTAL_CONTROL,
            WIFI_FEATURE_CONNECTION_LIST};
}

std::vector<WIFI_FEATURE> AdapterCapabilityKiteModel::GetFeature() const {
    return AllFeatures();
}

}  // namespace wifi
}  // namespace vornwireless
