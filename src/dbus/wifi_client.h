#ifndef VORN_DBUS_WIFI_CLIENT_H
#define VORN_DBUS_WIFI_CLIENT_H

#include <json/json.h>

#include <initializer_list>
#include <string>

#include "dbus/dbus_client.h"

namespace vornwireless {
namespace dbus {

// Calls the wifi daemon's service. Each method is one blocking call: 0 on success, negative on
// failure. An error reply is always a failure: one whose first number is 0 ("Adapter is not
// found(wlan0)") or that holds none gives -1.
class WifiClient : public DBusClient {
  public:
    WifiClient();
    ~WifiClient() override = default;

    // The daemon runs and owns its name on the bus.
    bool IsServerReady() const override;

    int GetAdapterList(Json::Value& list);
    int GetAdapterConfig(const std::string& ifname, Json::Value& config);
    int GetAdapterCapability(const std::string& ifname, Json::Value& capability);
    int GetAdapterStatus(const std::string& ifname, Json::Value& status);
    int GetConnectionList(const std::string& ifname, Json::Value& list);
    int GetConnectedAPInfo(const std::string& ifname, Json::Value& info);
    int GetBridgeList(Json::Value& list);
    int GetBridgeConfig(const std::string& ifname, Json::Value& config);
    int ScanNetworks(const std::string& ifname, Json::Value& networks);
    int ApplyAdapter(const std::string& ifname, const Json::Value& config);
    int ApplyBridge(const std::string& ifname, const Json::Value& config);
    int EnableAdapter(const std::string& ifname);
    int DisableAdapter(const std::string& ifname);
    int ExecSchedule(const std::string& ifname);
    // timeoutMs -1 is the usual 25 s wait; on a slow radio a switch can outlast it.
    int SwitchTopology(const std::string& topology, int timeoutMs = -1);
    int SwitchAdapterTopology(const std::string& ifname, const std::string& topology);
    int AddAdapter(const std::string& ifname);
    int RemoveAdapter(const std::string& ifname);
    int EnableWPSWithPBC(const std::string& ifname);
    int EnableWPSWithPinCode(const std::string& ifname, const std::string& pin);
    int RefreshAdapterList();
    int ForceRemoveAllAdapters();
    int RefreshWlanSlaveList();
    int SwitchWifiOnOff();
    int ResetToDefault();

  private:
    using Arguments = std::initializer_list<std::string>;
    // One call; the reply text goes to reply when it is not null.
    int Call(const char* method, Arguments arguments, std::string* reply, int timeoutMs = -1);
    // parseFailure takes the reply text.
    int CallForJson(const char* method, Arguments arguments, Json::Value& value,
                    const char* parseFailure);
};

}  // namespace dbus
}  // namespace vornwireless

#endif
