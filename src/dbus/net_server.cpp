#include "dbus/net_server.h"

#include <json/json.h>

#include <exception>
#include <string>

#include "network/module/module_manager.h"
#include "utils/json_text.h"
#include "utils/log.h"

namespace {

using vornnetwork::network::module::MODULE_DEVICE_LIST;
using vornnetwork::network::module::MODULE_IPV6;
using vornnetwork::network::module::MODULE_ROUTE;
using vornnetwork::network::module::MODULE_TYPE;
using vornnetwork::network::module::ModuleManager;
using vornwireless::dbus::BadParameter;
using vornwireless::dbus::SetHandlerError;

constexpr const char* kName = "com.tessarin.net";
constexpr const char* kPath = "/";

// Where one method goes: the request's "method", the module, and its failure texts (the log's and
// the error reply's).
struct Route {
    const char* method;
    MODULE_TYPE module;
    const char* logText;
    const char* errorText;
};

// Runs a request through the module manager and hands back the answer's styled text.
gboolean Forward(const Route& route, Json::Value& request, char** data, GError** error) {
    ModuleManager* manager = ModuleManager::GetInstance();
    if (manager == nullptr) {
        VORN_LOG(LOG_ERR, "failed to get network manager");
        SetHandlerError(error, "error", "failed to get network manager");
        return FALSE;
    }
    request["method"] = route.method;
    Json::Value answer;
    int result = -1;
    try {
        result = manager->ProcessRequest(route.module, request, answer);
    } catch (const std::exception& e) {
        VORN_LOG(LOG_ERR, "Request %s failed: %s", route.method, e.what());
    }
    if (result != 0) {
        VORN_LOG(LOG_ERR, "%s", route.logText);
        // A module that refused the request says why; the caller gets that too.
        std::string text = route.errorText;
        if (answer.isObject() && answer["error"].isString()) {
            text += ": " + answer["error"].asString();
        }
        SetHandlerError(error, "error", text.c_str());
        return FALSE;
    }
    if (data != nullptr) {
        *data = g_strdup(vornwireless::utils::StyledJson(answer).c_str());
    }
    return TRUE;
}

// A method whose argument is a JSON object: the caller's keys pass through, "method" is set.
gboolean ForwardJson(const Route& route, GObject* object, const char* text, char** data,
                     GError** error, const char* parseFailure = "Failed to parse info") {
    if (object == nullptr || text == nullptr) {
        return BadParameter(error);
    }
    Json::Value request;
    if (!vornwireless::utils::ParseJson(text, request) || !request.isObject()) {
        // No error object: the bus answers with its generic failure.
        VORN_LOG(LOG_ERR, "%s", parseFailure);
        return FALSE;
    }
    return Forward(route, request, data, error);
}

// A method whose argument is a plain string, put into a fresh request under key.
gboolean ForwardText(const Route& route, GObject* object, const char* key, const char* text,
                     char** data, GError** error) {
    if (object == nullptr) {
        return BadParameter(error);
    }
    Json::Value request(Json::objectValue);
    request[key] = text != nullptr ? text : "";
    return Forward(route, request, data, error);
}

const Route kGetDeviceList{"get", MODULE_DEVICE_LIST, "failed to get upnp data",
                           "failed to get upnp data"};
const Route kSetDeviceList{"set", MODULE_DEVICE_LIST, "failed to set device type",
                           "failed to set device type"};
const Route kDelDeviceList{"del", MODULE_DEVICE_LIST, "failed to delete data",
                           "failed to set delete data"};
const Route kGetGatewayList{"GET_GATEWAY_LIST_DATA", MODULE_ROUTE,
                            "failed to get gateway list data", "failed to get gateway list data"};
const Route kAddGateway{"ADD_GATEWAY_DATA", MODULE_ROUTE, "failed to add gateway data",
                        "failed to add gateway data"};
const Route kDelGateway{"DEL_GATEWAY_DATA", MODULE_ROUTE, "failed to del gateway data",
                        "failed to del gateway data"};
const Route kGetGatewayByInterface{"GET_GATEWAY_DATA_BY_INTERFACE", MODULE_ROUTE,
                                   "failed to get gateway data by interface",
                                   "failed to get gateway data by interface"};
const Route kSetSlave{"SET_SLAVE_DATA", MODULE_ROUTE, "failed to set slave data",
                      "failed to set slave data"};
const Route kCopyGateway{"COPY_GATEWAY_DATA", MODULE_ROUTE, "failed to copy gateway data",
                         "failed to copy gateway data"};
const Route kRefreshGateway{"REFRESH_GATEWAY", MODULE_ROUTE, "failed to refresh gateway",
                            "failed to refresh gateway"};
const Route kResetIPv6{"RESET_IPV6_MODULE", MODULE_IPV6, "failed to reset ipv6 module",
                       "failed to reset ipv6 module"};

}  // namespace

gboolean net_get_device_list_data(GObject* object, const char* type, char** data, GError** error) {
    return ForwardText(kGetDeviceList, object, "scannertype", type, data, error);
}

gboolean net_set_device_list_data(GObject* object, const char* data, GError** error) {
    return ForwardJson(kSetDeviceList, object, data, nullptr, error, "Failed to parse device data");
}

gboolean net_del_device_list_data(GObject* object, const char* mac, GError** error) {
    return ForwardText(kDelDeviceList, object, "macAddr", mac, nullptr, error);
}

gboolean net_get_gateway_list_data(GObject* object, const char* info, char** data, GError** error) {
    return ForwardJson(kGetGatewayList, object, info, data, error);
}

gboolean net_add_gateway_data(GObject* object, const char* info, GError** error) {
    return ForwardJson(kAddGateway, object, info, nullptr, error);
}

gboolean net_del_gateway_data(GObject* object, const char* info, GError** error) {
    return ForwardJson(kDelGateway, object, info, nullptr, error);
}

gboolean net_get_gateway_data_by_interface(GObject* object, const char* info, char** data,
                                           GError** error) {
    return ForwardJson(kGetGatewayByInterface, object, info, data, error);
}

gboolean net_set_slave_data(GObject* object, const char* info, GError** error) {
    return ForwardJson(kSetSlave, object, info, nullptr, error);
}

gboolean net_copy_gateway_data(GObject* object, const char* info, GError** error) {
    return ForwardJson(kCopyGateway, object, info, nullptr, error);
}

gboolean net_refresh_gateway(GObject* object, const char* type, GError** error) {
    return ForwardJson(kRefreshGateway, object, type, nullptr, error);
}

gboolean net_reset_ipv6_module(GObject* object, const char* info, GError** error) {
    return ForwardText(kResetIPv6, object, "ifname", info, nullptr, error);
}

namespace vornnetwork {
namespace dbus {

const char* const NetServer::kIntrospection = R"(<node>
  <interface name="com.tessarin.net">
    <method name="GetDeviceListData"><arg name="type" type="s" direction="in"/><arg name="data" type="s" direction="out"/></method>
    <method name="SetDeviceListData"><arg name="data" type="s" direction="in"/></method>
    <method name="DelDeviceListData"><arg name="mac" type="s" direction="in"/></method>
    <method name="GetGatewayListData"><arg name="info" type="s" direction="in"/><arg name="data" type="s" direction="out"/></method>
    <method name="AddGatewayData"><arg name="info" type="s" direction="in"/></method>
    <method name="DelGatewayData"><arg name="info" type="s" direction="in"/></method>
    <method name="GetGatewayDataByInterface"><arg name="info" type="s" direction="in"/><arg name="data" type="s" direction="out"/></method>
    <method name="SetSlaveData"><arg name="info" type="s" direction="in"/></method>
    <method name="CopyGatewayData"><arg name="info" type="s" direction="in"/></method>
    <method name="RefreshGateway"><arg name="type" type="s" direction="in"/></method>
    <method name="ResetIPv6Module"><arg name="info" type="s" direction="in"/></method>
  </interface>
</node>)";

NetServer::NetServer()
    : DBusServer(kName, kPath, vornwireless::dbus::DBUS_BUS_SESSION),
      object_(static_cast<GObject*>(g_object_new(G_TYPE_OBJECT, nullptr))) {
    using vornwireless::dbus::DBusMethod;
    Initialize(kIntrospection,
               {
                   DBusMethod("GetDeviceListData", &net_get_device_list_data),
                   DBusMethod("SetDeviceListData", &net_set_device_list_data),
                   DBusMethod("DelDeviceListData", &net_del_device_list_data),
                   DBusMethod("GetGatewayListData", &net_get_gateway_list_data),
                   DBusMethod("AddGatewayData", &net_add_gateway_data),
                   DBusMethod("DelGatewayData", &net_del_gateway_data),
                   DBusMethod("GetGatewayDataByInterface", &net_get_gateway_data_by_interface),
                   DBusMethod("SetSlaveData", &net_set_slave_data),
                   DBusMethod("CopyGatewayData", &net_copy_gateway_data),
                   DBusMethod("RefreshGateway", &net_refresh_gateway),
                   DBusMethod("ResetIPv6Module", &net_reset_ipv6_module),
               },
               object_);
}

NetServer::~NetServer() {
    g_object_unref(object_);
}

}  // namespace dbus
}  // namespace vornnetwork
