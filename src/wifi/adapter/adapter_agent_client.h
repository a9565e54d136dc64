#ifndef VORN_WIFI_ADAPTER_ADAPTER_AGENT_CLIENT_H
#define VORN_WIFI_ADAPTER_ADAPTER_AGENT_CLIENT_H

#include <string>
#include <vector>

#include "wifi/adapter/adapter_agent_client_base.h"

namespace vornwireless {
namespace wifi {

// A station client on a standard radio, through wpa_supplicant, wpa_cli, iwlist and iwconfig.
class AdapterAgentClient : public AdapterAgentClientBase {
  public:
    explicit AdapterAgentClient(const std::string& name) : AdapterAgentClientBase(name) {}

    // Enabled once associated (or the address status after it), Enabling while the supplicant
    // runs unassociated, else Disabled.
    WIFI_STATUS GetStatus(const AdapterConfig& config) const override;
    // Nothing while the supplicant is associated, else ClientEnable.
    int ClientRecover(const AdapterConfig& config) override;
    int AdHocEnable(const AdapterConfig& config) override { return ClientEnable(config); }
    int AdHocRecover(const AdapterConfig& config) override { return ClientRecover(config); }
    int AdHocDisable(const AdapterConfig&) override { return DoDisconnect(); }
    // Writes the supplicant file, starts the supplicant, waits up to 15 polls for the
    // association, starts the reconnection watcher and sets up the address.
    int DoConnecting() override;
    int DoDisconnect() override;

    // The supplicant file for a network. A text the file cannot carry is refused (-1, logged):
    // an essid of 0 or over 32 bytes, a password or identity holding a double quote or a control
    // byte, a key of the wrong form. An essid holding a double quote, a backslash or a byte
    // outside printable ASCII is written as hex digits.
    static int WpaSupplicantConfigText(const AdapterConfig::StationInfo& station,
                                       std::string& text);

    static std::string ConfigFile(const std::string& ifname);
    static std::string PidFile(const std::string& ifname);

  private:
    int SetWpaSupplicantConfig() const;
    bool WaitForAssociation() const;
    std::string WpaState() const;
    int SupplicantPid() const;
    int TerminateWpa() const;
    int DisconnectKillWpa() const;
    int TakeInterfaceDown() const;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
