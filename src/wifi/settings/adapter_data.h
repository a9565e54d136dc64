#ifndef VORN_WIFI_SETTINGS_ADAPTER_DATA_H
#define VORN_WIFI_SETTINGS_ADAPTER_DATA_H

#include <cstdint>
#include <memory>
#include <string>

#include "wifi/settings/adapter_config.h"

namespace vornwireless {
namespace wifi {

// What a running adapter must redo to take on a new configuration.
struct RELOAD_STATUS {
    bool restart = false;
    bool tx_power = false;
    bool schedule = false;
    bool guest_schedule = false;
    bool guest_rule = false;
};

// Assigns incoming when it differs; tells whether it did.
template <typename T>
bool SetReloadData(T& stored, const T& incoming) {
    if (stored == incoming) {
        return false;
    }
    stored = incoming;
    return true;
}

// The current configuration of one adapter and its files under "/usr/vorn/etc/wifi/": the
// access-point file "wifi_ap_" + MAC, the client file "wifi_client_" + MAC and the MAC filter
// files under "/etc/hostapd/mac_filter/".
class AdapterData {
  public:
    // Reads the adapter's files (defaults on first start) with every reload flag set; null when
    // the read fails.
    static AdapterData* Create(const std::string& name);
    static int Delete(AdapterData* data);
    ~AdapterData();
    AdapterData(const AdapterData&) = delete;
    AdapterData& operator=(const AdapterData&) = delete;

    const AdapterConfig& GetConfig() const { return *config_; }
    // Changes whenever the configuration may have; no two configurations of any adapter in this
    // process share one, so it can key a cache of what is derived from the configuration.
    std::uint64_t Revision() const { return revision_; }
    RELOAD_STATUS GetReloadStatus() const { return reload_; }
    void ResetReloadStatus() { reload_ = RELOAD_STATUS(); }
    void EnableReloadStatus() { reload_ = RELOAD_STATUS{true, true, true, true, true}; }
    bool NeedReload() const;

    // Replaces the configuration only when the whole of it was read.
    int Read();
    // Writes the files of the current topology. Always 0: a failed step shows only in the log.
    int Write() const;

    // Raises the reload flags for what changed, then keeps a copy of config.
    int SetConfig(const AdapterConfig& config);
    int SetAPConfig(const AdapterConfig& config);
    // Merges the first station of config into the known ones (replacing one of the same BSSID).
    int SetClientConfig(const AdapterConfig& config);

  private:
    explicit AdapterData(const std::string& name);

    int ReadAccessPoint(AdapterConfig& config) const;
    int ReadMacFilter(AdapterConfig& config) const;
    int ReadClient(AdapterConfig& config) const;
    void MoveObsoleteClientFile(const std::string& clientFile) const;
    void WriteAccessPoint() const;
    void WriteMacFilter() const;
    void WriteClient() const;

    void NewRevision();

    std::unique_ptr<AdapterConfig> config_;
    RELOAD_STATUS reload_;
    std::uint64_t revision_ = 0;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
