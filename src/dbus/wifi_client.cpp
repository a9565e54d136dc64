#include "dbus/wifi_client.h"

#include "utils/json_text.h"
#include "utils/log.h"
#include "utils/process.h"

namespace vornwireless {
namespace dbus {
namespace {

constexpr const char* kName = "com.tessarin.wifi";
constexpr const char* kParseConfigFailure = "Failed to parse config[%s]";

}  // namespace

using vornwireless::utils::StyledJson;

WifiClient::WifiClient() : DBusClient(kName, "/", kName, DBUS_BUS_SESSION) {}

bool WifiClient::IsServerReady() const {
    return utils::IsProcessAlive("vornwifid") && DBusClient::IsServerReady();
}

int WifiClient::Call(const char* method, Arguments arguments, std::string* reply, int timeoutMs) {
    int result = NewMessage(method);
    for (const std::string& argument : arguments) {
        if (result == 0) {
            result = Append(argument);
        }
    }
    if (result == 0) {
        result = SendMessage(true, timeoutMs);
    }
    // The digits of an interface name can read as 0: an error reply is a failure all the same.
    if (result == 0 && !HasReply()) {
        result = -1;
    }
    if (result == 0 && reply != nullptr) {
        result = GetReply(*reply);
    }
    return result;
}

int WifiClient::CallForJson(const char* method, Arguments arguments, Json::Value& value,
                            const char* parseFailure) {
    std::string reply;
    const int result = Call(method, arguments, &reply);
    if (result != 0) {
        return result;
    }
    if (!utils::ParseJson(reply, value, utils::kMaxJsonReplyLength)) {
        VORN_LOG(LOG_ERR, parseFailure, reply.c_str());
        return -1;
    }
    return 0;
}

int WifiClient::GetAdapterList(Json::Value& list) {
    return CallForJson("GetAdapterList", {}, list, "Failed to parse adapter list[%s]");
}

int WifiClient::GetAdapterConfig(const std::string& ifname, Json::Value& config) {
    return CallForJson("GetAdapterConfig", {ifname}, config, kParseConfigFailure);
}

int WifiClient::GetAdapterCapability(const std::string& ifname, Json::Value& capability) {
    return CallForJson("GetAdapterCapability", {ifname}, capability, kParseConfigFailure);
}

int WifiClient::GetAdapterStatus(const std::string& ifname, Json::Value& status) {
    return CallForJson("GetAdapterStatus", {ifname}, status, kParseConfigFailure);
}

int WifiClient::GetConnectionList(const std::string& ifname, Json::Value& list) {
    return CallForJson("GetConnectionList", {ifname}, list, kParseConfigFailure);
}

int WifiClient::GetConnectedAPInfo(const std::string& ifname, Json::Value& info) {
    return CallForJson("GetConnectedAPInfo", {ifname}, info, kParseConfigFailure);
}

int WifiClient::GetBridgeList(Json::Value& list) {
    return CallForJson("GetBridgeList", {}, list, "Failed to parse bridge list[%s]");
}

int WifiClient::GetBridgeConfig(const std::string& ifname, Json::Value& config) {
    return CallForJson("GetBridgeConfig", {ifname}, config, kParseConfigFailure);
}

int WifiClient::ScanNetworks(const std::string& ifname, Json::Value& networks) {
    return CallForJson("ScanNetworks", {ifname}, networks, kParseConfigFailure);
}

int WifiClient::ApplyAdapter(const std::string& ifname, const Json::Value& config) {
    return Call("ApplyAdapter", {ifname, StyledJson(config)}, nullptr);
}

int WifiClient::ApplyBridge(const std::string& ifname, const Json::Value& config) {
    return Call("ApplyBridge", {ifname, StyledJson(config)}, nullptr);
}

int WifiClient::EnableAdapter(const std::string& ifname) {
    return Call("EnableAdapter", {ifname}, nullptr);
}

int WifiClient::DisableAdapter(const std::string& ifname) {
    return Call("DisableAdapter", {ifname}, nullptr);
}

int WifiClient::ExecSchedule(const std::string& ifname) {
    return Call("ExecSchedule", {ifname}, nullptr);
}

int WifiClient::SwitchTopology(const std::string& topology, int timeoutMs) {
    return Call("SwitchTopology", {topology}, nullptr, timeoutMs);
}

int WifiClient::SwitchAdapterTopology(const std::string& ifname, const std::string& topology) {
    return Call("SwitchAdapterTopology", {ifname, topology}, nullptr);
}

int WifiClient::AddAdapter(const std::string& ifname) {
    return Call("AddAdapter", {ifname}, nullptr);
}

int WifiClient::RemoveAdapter(const std::string& ifname) {
    return Call("RemoveAdapter", {ifname}, nullptr);
}

int WifiClient::EnableWPSWithPBC(const std::string& ifname) {
    return Call("EnableWPSWithPBC", {ifname}, nullptr);
}

int WifiClient::EnableWPSWithPinCode(const std::string& ifname, const std::string& pin) {
    return Call("EnableWPSWithPinCode", {ifname, pin}, nullptr);
}

int WifiClient::RefreshAdapterList() {
    return Call("RefreshAdapterList", {}, nullptr);
}

int WifiClient::ForceRemoveAllAdapters() {
    return Call("ForceRemoveAllAdapters", {}, nullptr);
}

int WifiClient::RefreshWlanSlaveList() {
    return Call("RefreshWlanSlaveList", {}, nullptr);
}

int WifiClient::SwitchWifiOnOff() {
    return Call("SwitchWifiOnOff", {}, nullptr);
}

int WifiClient::ResetToDefault() {
    return Call("ResetToDefault", {}, nullptr);
}

}  // namespace dbus
}  // namespace vornwireless
