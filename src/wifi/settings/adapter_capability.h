#ifndef VORN_WIFI_SETTINGS_ADAPTER_CAPABILITY_H
#define VORN_WIFI_SETTINGS_ADAPTER_CAPABILITY_H

#include <string>
#include <vector>

#include "wifi/settings/adapter_config.h"
#include "wifi/settings/enum.h"

namespace vornwireless {
namespace wifi {

// What one radio supports, and the check of a configuration against it.
class AdapterCapability {
  public:
    // The built-in radio of the kite-b model gets the RLT capability, other radios of a Kite
    // model the Kite one, everything else this general one.
    static AdapterCapability* Create(const std::string& name);
    static int Delete(AdapterCapability* capability);

    explicit AdapterCapability(const std::string& name) : name_(name) {}

    // 0 when config is allowed; else logs the first rejected value and returns -1. Channel, MAC
    // filter policy and features are not checked: the channel list depends on the live radio.
    virtual int Verify(const AdapterConfig& config) const;
    virtual std::vector<WIFI_TOPOLOGY> GetTopology() const;
    virtual std::vector<WIFI_FEATURE> GetFeature() const;
    // The modes the radio reports through iwconfig.
    virtual std::vector<WIFI_MODE> GetMode() const;
    virtual std::vector<WIFI_BANDWIDTH> GetBandwidth() const;
    // The channels the radio reports through "iwlist IF active_channel".
    virtual std::vector<int> GetChannel() const;
    virtual std::vector<WIFI_POWER> GetPower() const;
    virtual int GetMaxNumClient() const;
    virtual std::vector<WIFI_SECURITY> GetSecurity() const;
    virtual std::vector<WIFI_ENCRYPTION> GetEncryption() const;
    virtual std::vector<WIFI_MAC_FILTER_POLICY> GetMacFilterPolicy() const;
    virtual int GetGuestNetworkMaxNumClient() const;
    virtual std::vector<WIFI_SECURITY> GetGuestNetworkSecurity() const;
    virtual std::vector<WIFI_ENCRYPTION> GetGuestNetworkEncryption() const;
    virtual ~AdapterCapability() = default;

    // A 5 GHz mode needs a scan first (the radio's regulatory state); the interface is brought
    // up for it when it is down. 0 or -1; other modes need nothing.
    int Enable5GMode(WIFI_MODE mode) const;

  private:
    std::string name_;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
