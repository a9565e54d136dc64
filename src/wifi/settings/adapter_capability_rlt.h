#ifndef VORN_WIFI_SETTINGS_ADAPTER_CAPABILITY_RLT_H
#define VORN_WIFI_SETTINGS_ADAPTER_CAPABILITY_RLT_H

#include "wifi/settings/adapter_capability.h"

namespace vornwireless {
namespace wifi {

// The built-in dual-band radio of the kite-b model, run through its own driver: its lists are
// fixed, not asked of the radio.
class AdapterCapabilityRLT : public AdapterCapability {
  public:
    using AdapterCapability::AdapterCapability;
    // The general checks, and CheckRLTConfig: the driver's files cannot carry ";".
    int Verify(const AdapterConfig& config) const override;
    std::vector<WIFI_FEATURE> GetFeature() const override;
    std::vector<WIFI_MODE> GetMode() const override;
    std::vector<WIFI_BANDWIDTH> GetBandwidth() const override;
    // From the driver's frequency table: 2.4 GHz channels 1-13, 5 GHz 36-64, 100-140, 149-165.
    std::vector<int> GetChannel() const override;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
