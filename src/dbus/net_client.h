#ifndef VORN_DBUS_NET_CLIENT_H
#define VORN_DBUS_NET_CLIENT_H

#include <json/json.h>

#include <string>

#include "dbus/dbus_client.h"

namespace vornnetwork {
namespace dbus {

// Calls the network daemon's service. Each method is one blocking call: 0 on success, negative on
// failure.
class NetClient : public vornwireless::dbus::DBusClient {
  public:
    NetClient();
    ~NetClient() override = default;

    // The daemon runs and owns its name on the bus.
    bool IsServerReady() const override;

    int GetDeviceListData(const std::string& type, Json::Value& data);
    int SetDeviceListData(const Json::Value& data);
    int DelDeviceListData(const std::string& mac);
    int GetGatewayListData(Json::Value& info, Json::Value& data);
    int AddGatewayData(Json::Value& info);
    int DelGatewayData(Json::Value& info);
    int GetGatewayDataByInterface(Json::Value& info, Json::Value& data);
    int SetSlaveData(Json::Value& info);
    int CopyGatewayData(Json::Value& info);
    int RefreshGateway(Json::Value& info);
    int ResetIPv6Module(const std::string& ifname);

  private:
    // One call with one string argument; the reply text goes to reply when it is not null.
    int Call(const char* method, const std::string& argument, std::string* reply);
    int CallForJson(const char* method, const std::string& argument, Json::Value& data,
                    const char* parseFailure);
};

}  // namespace dbus
}  // namespace vornnetwork

#endif
