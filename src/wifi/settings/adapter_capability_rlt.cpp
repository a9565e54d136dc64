#include "wifi/settings/adapter_capability_rlt.h"

#include "wifi/settings/adapter_capability_kite_model.h"
#include "wifi/settings/adapter_config_check.h"

namespace vornwireless {
namespace wifi {
namespace {

constexpr int kBand24Base = 2407;
constexpr int kBand5Base = 5000;
constexpr int kBand5Start = 5000;
constexpr int kMhzPerChannel = 5;

// Centre frequencies in MHz the driver serves.
constexpr int kFrequencies[] = {2412, 2417, 2422, 2427, 2432, 2437, 2442, 2447, 2452, 2457,
                                2462, 2467, 2472, 5180, 5200, 5220, 5240, 5260, 5280, 5300,
                                5320, 5500, 5520, 5540, 5560, 5580, 5600, 5620, 5640, 5660,
                                5680, 5700, 5745, 5765, 5785, 5805, 5825};

}  // namespace

std::vector<WIFI_FEATURE> AdapterCapabilityRLT::GetFeature() const {
    return AllFeatures();
}

std::vector<WIFI_MODE> AdapterCapabilityRLT::GetMode() const {
    return {WIFI_MODE_A,  WIFI_MODE_B,  WIFI_MODE_G,   WIFI_MODE_N,    WIFI_MODE_AN,
            WIFI_MODE_GN, WIFI_MODE_BG, WIFI_MODE_BGN, WIFI_MODE_AN_AC};
}

std::vector<WIFI_BANDWIDTH> AdapterCapabilityRLT::GetBandwidth() const {
    return {WIFI_BANDWIDTH_20MHZ, WIFI_BANDWIDTH_20_40MHZ, WIFI_BANDWIDTH_20_40_80MHZ};
}

std::vector<int> AdapterCapabilityRLT::GetChannel() const {
    std::vector<int> channels;
    for (int frequency : kFrequencies) {
        const int base = frequency >= kBand5Start ? kBand5Base : kBand24Base;
        channels.push_back((frequency - base) / kMhzPerChannel);
    }
    return channels;
}

int AdapterCapabilityRLT::Verify(const AdapterConfig& config) const {
    if (AdapterCapability::Verify(config) < 0) {
        return -1;
    }
    return CheckRLTConfig(config);
}

}  // namespace wifi
}  // namespace vornwireless
