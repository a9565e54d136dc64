#ifndef VORN_WIFI_SETTINGS_ADAPTER_CAPABILITY_KITE_MODEL_H
#define VORN_WIFI_SETTINGS_ADAPTER_CAPABILITY_KITE_MODEL_H

#include "wifi/settings/adapter_capability.h"

namespace vornwireless {
namespace wifi {

// A radio of the Kite model line: every optional feature.
class AdapterCapabilityKiteModel : public AdapterCapability {
  public:
    using AdapterCapability::AdapterCapability;
    std::vector<WIFI_FEATURE> GetFeature() const override;
};

// Every optional feature, in value order.
std::vector<WIFI_FEATURE> AllFeatures();

}  // namespace wifi
}  // namespace vornwireless

#endif
