#include "dbus/net_client.h"

#include "utils/json_text.h"
#include "utils/log.h"
#include "utils/process.h"

namespace vornnetwork {
namespace dbus {

using vornwireless::utils::StyledJson;

NetClient::NetClient()
    : DBusClient("com.tessarin.net", "/", "com.tessarin.net",
                 vornwireless::dbus::DBUS_BUS_SESSION) {}

bool NetClient::IsServerReady() const {
    return vornwireless::utils::IsProcessAlive("vornnetd") && DBusClient::IsServerReady();
}

int NetClient::Call(const char* method, const std::string& argument, std::string* reply) {
    int result = NewMessage(method);
    if (result == 0) {
        result = Append(argument);
    }
    if (result == 0) {
        result = SendMessage(true, -1);
    }
    if (result == 0 && reply != nullptr) {
        result = GetReply(*reply);
    }
    return result;
}

int NetClient::CallForJson(const char* method, const std::string& argument, Json::Value& data,
                           const char* parseFailure) {
    std::string reply;
    const int result = Call(method, argument, &reply);
    if (result != 0) {
        return result;
    }
    if (!vornwireless::utils::ParseJson(reply, data, vornwireless::utils::kMaxJsonReplyLength)) {
        VORN_LOG(LOG_ERR, "%s", parseFailure);
        return -1;
    }
    return 0;
}

int NetClient::GetDeviceListData(const std::string& type, Json::Value& data) {
    return CallForJson("GetDeviceListData", type, data, "Failed to parse upnp data");
}

int NetClient::SetDeviceListData(const Json::Value& data) {
    return Call("SetDeviceListData", StyledJson(data), nullptr);
}

int NetClient::DelDeviceListData(const std::string& mac) {
    return Call("DelDeviceListData", mac, nullptr);
}

int NetClient::GetGatewayListData(Json::Value& info, Json::Value& data) {
    return CallForJson("GetGatewayListData", StyledJson(info), data,
                       "Failed to get gateway list data");
}

int NetClient::AddGatewayData(Json::Value& info) {
    return Call("AddGatewayData", StyledJson(info), nullptr);
}

int NetClient::DelGatewayData(Json::Value& info) {
    return Call("DelGatewayData", StyledJson(info), nullptr);
}

int NetClient::GetGatewayDataByInterface(Json::Value& info, Json::Value& data) {
    return CallForJson("GetGatewayDataByInterface", StyledJson(info), data,
                       "Failed to get gateway data by interface");
}

int NetClient::SetSlaveData(Json::Value& info) {
    return Call("SetSlaveData", StyledJson(info), nullptr);
}

int NetClient::CopyGatewayData(Json::Value& info) {
    return Call("CopyGatewayData", StyledJson(info), nullptr);
}

int NetClient::RefreshGateway(Json::Value& info) {
    return Call("RefreshGateway", StyledJson(info), nullptr);
}

int NetClient::ResetIPv6Module(const std::string& ifname) {
    return Call("ResetIPv6Module", ifname, nullptr);
}

}  // namespace dbus
}  // namespace vornnetwork
