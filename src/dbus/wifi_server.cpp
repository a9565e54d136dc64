#include "dbus/wifi_server.h"

#include <json/json.h>

#include <chrono>
#include <cstdint>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "hook/base_hook.h"
#include "platform/qlib_plugin.h"
#include "utils/json_text.h"
#include "utils/log.h"
#include "wifi/adapter/adapter.h"
#include "wifi/bridge/bridge_base.h"
#include "wifi/settings/enum_map.h"
#include "wifi/utils/adapter_config_json.h"
#include "wifi/utils/bridge_config_json.h"
#include "wifi/utils/station_utils.h"
#include "wifi/utils/utils.h"

// Logs the text and answers it as the error reply (domain "error", code 1); FALSE. A macro, so
// the log line names the handler's line.
#define WIFI_FAIL(error, ...)        \
    (VORN_LOG(LOG_ERR, __VA_ARGS__), \
     g_set_error((error), g_quark_from_static_string("error"), 1, __VA_ARGS__), FALSE)

namespace {

using vornwireless::dbus::BadParameter;
using vornwireless::wifi::Adapter;
using vornwireless::wifi::AdapterConfig;
using vornwireless::wifi::BridgeBase;
using vornwireless::wifi::BridgeConfig;
using vornwireless::wifi::EnumMap;
using vornwireless::wifi::WIFI_STATUS;
using vornwireless::wifi::WIFI_TOPOLOGY;
namespace wifiutils = vornwireless::wifi::utils;

constexpr const char* kName = "com.tessarin.wifi";
constexpr const char* kPath = "/";
constexpr std::chrono::seconds kRefreshLimit{10};
constexpr std::chrono::seconds kRefreshPause{1};

gboolean Reply(const Json::Value& value, char** out) {
    *out = g_strdup(vornwireless::utils::StyledJson(value).c_str());
    return TRUE;
}

// The adapter of ifname, or null with the error "Adapter is not found(IF)".
Adapter* FindAdapter(const char* ifname, GError** error) {
    Adapter* adapter = Adapter::GetAdapter(ifname);
    if (adapter == nullptr) {
        static_cast<void>(WIFI_FAIL(error, "Adapter is not found(%s)", ifname));
    }
    return adapter;
}

// The same lookup with the station methods' wording.
Adapter* FindAdapterForInterface(const char* ifname, GError** error) {
    Adapter* adapter = Adapter::GetAdapter(ifname);
    if (adapter == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to get adapter for interface (%s)", ifname);
        g_set_error(error, g_quark_from_static_string("error"), 1,
                    "Failed to get adapter for interface(%s)", ifname);
    }
    return adapter;
}

// Runs one operation of the named adapter; failureFormat takes the interface name.
gboolean RunOnAdapter(GObject* object, const char* ifname, GError** error,
                      int (Adapter::*operation)(), const char* failureFormat) {
    if (object == nullptr || ifname == nullptr) {
        return BadParameter(error);
    }
    Adapter* adapter = FindAdapter(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    if ((adapter->*operation)() != 0) {
        return WIFI_FAIL(error, failureFormat, ifname);
    }
    return TRUE;
}

// Runs an operation of the adapter list on one interface name.
gboolean RunOnName(GObject* object, const char* ifname, GError** error,
                   int (*operation)(const std::string&), const char* failureFormat) {
    if (object == nullptr || ifname == nullptr) {
        return BadParameter(error);
    }
    if (operation(ifname) != 0) {
        return WIFI_FAIL(error, failureFormat, ifname);
    }
    return TRUE;
}

// Runs an operation of every adapter; failure is the whole error text.
gboolean RunOnAll(GObject* object, GError** error, int (*operation)(), const char* failure) {
    if (object == nullptr) {
        return BadParameter(error);
    }
    if (operation() != 0) {
        return WIFI_FAIL(error, "%s", failure);
    }
    return TRUE;
}

// Runs refresh until it finds something, fails, or kRefreshLimit passes (giving up is success).
gboolean RefreshUntilFound(GObject* object, GError** error, int (*refresh)(), const char* logFormat,
                           const char* errorFormat) {
    if (object == nullptr) {
        return BadParameter(error);
    }
    const auto start = std::chrono::steady_clock::now();
    for (;;) {
        const int result = refresh();
        if (result > 0) {
            return TRUE;
        }
        if (result < 0) {
            VORN_LOG(LOG_ERR, logFormat, result);
            g_set_error(error, g_quark_from_static_string("error"), 1, errorFormat, result);
            return FALSE;
        }
        std::this_thread::sleep_for(kRefreshPause);
        if (std::chrono::steady_clock::now() - start >= kRefreshLimit) {
            return TRUE;
        }
    }
}

template <typename E>
Json::Value EnumNames(const std::vector<E>& values) {
    Json::Value names(Json::arrayValue);
    for (E value : values) {
        names.append(EnumMap<E>::EnumToString(value));
    }
    return names;
}

// What the radio supports, the values as the configuration's JSON writes them.
Json::Value CapabilityJson(const vornwireless::wifi::AdapterCapability& capability) {
    Json::Value json(Json::objectValue);
    json["topology"] = EnumNames(capability.GetTopology());
    json["feature"] = EnumNames(capability.GetFeature());
    json["mode"] = EnumNames(capability.GetMode());
    json["bandwidth"] = EnumNames(capability.GetBandwidth());
    json["channel"] = Json::Value(Json::arrayValue);
    for (int channel : capability.GetChannel()) {
        json["channel"].append(channel);
    }
    json["power"] = EnumNames(capability.GetPower());
    json["max_num_client"] = capability.GetMaxNumClient();
    json["security"] = EnumNames(capability.GetSecurity());
    json["encryption"] = EnumNames(capability.GetEncryption());
    json["mac_filter_policy"] = EnumNames(capability.GetMacFilterPolicy());
    json["guest_max_num_client"] = capability.GetGuestNetworkMaxNumClient();
    json["guest_security"] = EnumNames(capability.GetGuestNetworkSecurity());
    json["guest_encryption"] = EnumNames(capability.GetGuestNetworkEncryption());
    return json;
}

// A topology word a switch can go to; "error" is a table entry but no topology.
bool IsTopologyWord(const char* word) {
    return EnumMap<WIFI_TOPOLOGY>::IsKnown(word) &&
           EnumMap<WIFI_TOPOLOGY>::StringToEnum(word) != vornwireless::wifi::WIFI_TOPOLOGY_ERROR;
}

// The guest networks follow the appliance-wide IPv6 DNS servers of the bridge being applied;
// everything else of theirs stays their own.
void ReapplyGuestBridges(const std::string& applied, const BridgeConfig& config) {
    for (const auto& bridge : BridgeBase::GetList()) {
        if (!BridgeBase::IsGuestBridge(bridge->GetName()) || bridge->GetName() == applied) {
            continue;
        }
        BridgeConfig guest = bridge->GetConfig();
        guest.ipv6Pdns = config.ipv6Pdns;
        guest.ipv6Sdns = config.ipv6Sdns;
        if (bridge->Apply(guest) != 0) {
            VORN_LOG(LOG_ERR, "Failed to apply guest bridge [%s]", bridge->GetNameC());
        }
    }
}

}  // namespace

gboolean wifi_get_adapter_list(GObject* object, char** list, GError** error) {
    if (object == nullptr || list == nullptr) {
        return BadParameter(error);
    }
    Json::Value names(Json::arrayValue);
    for (const auto& adapter : Adapter::GetList()) {
        names.append(adapter->GetConfig().name);
    }
    return Reply(names, list);
}

// The styled text of each adapter's configuration, built again only when its revision changed:
// building it costs more than all the rest of a "GetAdapterConfig" call. Handlers run on the
// service thread only.
const std::string& ConfigText(const Adapter& adapter) {
    struct Entry {
        std::uint64_t revision = 0;
        std::string text;
    };
    static std::map<std::string, Entry> cache;
    Entry& entry = cache[adapter.GetName()];
    const std::uint64_t revision = adapter.GetConfigRevision();
    if (entry.text.empty() || entry.revision != revision) {
        entry.text = vornwireless::utils::StyledJson(wifiutils::GetJsonValue(adapter.GetConfig()));
        entry.revision = revision;
    }
    return entry.text;
}

gboolean wifi_get_adapter_config(GObject* object, const char* ifname, char** config,
                                 GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    const Adapter* adapter = FindAdapter(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    *config = g_strdup(ConfigText(*adapter).c_str());
    return TRUE;
}

gboolean wifi_get_adapter_capability(GObject* object, const char* ifname, char** capability,
                                     GError** error) {
    if (object == nullptr || ifname == nullptr || capability == nullptr) {
        return BadParameter(error);
    }
    const Adapter* adapter = FindAdapter(ifname, error);
    return adapter != nullptr && Reply(CapabilityJson(*adapter->GetCapability()), capability);
}

gboolean wifi_get_adapter_status(GObject* object, const char* ifname, char** status,
                                 GError** error) {
    if (object == nullptr || ifname == nullptr || status == nullptr) {
        return BadParameter(error);
    }
    const Adapter* adapter = FindAdapter(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    Json::Value json(Json::objectValue);
    json["status"] = EnumMap<WIFI_STATUS>::EnumToString(adapter->GetStatus());
    return Reply(json, status);
}

gboolean wifi_enable_adapter(GObject* object, const char* ifname, GError** error) {
    return RunOnAdapter(object, ifname, error, &Adapter::Initialize,
                        "Failed to enable adapter(%s)");
}

gboolean wifi_disable_adapter(GObject* object, const char* ifname, GError** error) {
    return RunOnAdapter(object, ifname, error, &Adapter::Terminate,
                        "Failed to disable adapter(%s)");
}

gboolean wifi_exec_schedule(GObject* object, const char* ifname, GError** error) {
    return RunOnAdapter(object, ifname, error,
                        static_cast<int (Adapter::*)()>(&Adapter::ExecSchedule),
                        "Failed to execute schedule(%s)");
}

gboolean wifi_apply_adapter(GObject* object, const char* ifname, const char* config,
                            GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    Adapter* adapter = FindAdapter(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    Json::Value json;
    AdapterConfig parsed = adapter->GetConfig();
    if (!vornwireless::utils::ParseJson(config, json) || wifiutils::GetConfig(json, parsed) != 0) {
        return WIFI_FAIL(error, "Failed to get config(%s)", ifname);
    }
    if (adapter->Apply(parsed) != 0) {
        return WIFI_FAIL(error, "Failed to apply config(%s)", ifname);
    }
    return TRUE;
}

gboolean wifi_switch_topology(GObject* object, const char* topology, GError** error) {
    if (object == nullptr || topology == nullptr) {
        return BadParameter(error);
    }
    // Checked before the hooks see it: the word reaches their environment.
    if (!IsTopologyWord(topology)) {
        return WIFI_FAIL(error, "Failed to switch topology(%s)", topology);
    }
    std::string old;
    if (wifiutils::GetTopologyString(old) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get old topology");
        return FALSE;
    }
    vornwireless::hook::TopologyChangeHook hook(old, topology);
    hook.ExecHook(QLIB_PLUGIN_ACTION_BEFORE);
    const gboolean switched =
        Adapter::SwitchNetTopology(EnumMap<WIFI_TOPOLOGY>::StringToEnum(topology)) == 0 ||
        WIFI_FAIL(error, "Failed to switch topology(%s)", topology);
    hook.ExecHook(QLIB_PLUGIN_ACTION_AFTER);
    return switched;
}

gboolean wifi_switch_adapter_topology(GObject* object, const char* ifname, const char* topology,
                                      GError** error) {
    if (object == nullptr || ifname == nullptr || topology == nullptr) {
        return BadParameter(error);
    }
    if (FindAdapter(ifname, error) == nullptr) {
        return FALSE;
    }
    if (!IsTopologyWord(topology)) {
        return WIFI_FAIL(error, "Failed to switch topology(%s)", ifname);
    }
    Adapter::SwitchTopology(EnumMap<WIFI_TOPOLOGY>::StringToEnum(topology));
    return TRUE;
}

gboolean wifi_add_adapter(GObject* object, const char* ifname, GError** error) {
    return RunOnName(object, ifname, error, &Adapter::AddAdapter, "Failed to add adapter(%s)");
}

gboolean wifi_remove_adapter(GObject* object, const char* ifname, GError** error) {
    return RunOnName(object, ifname, error, &Adapter::RemoveAdapter,
                     "Failed to remove adapter(%s)");
}

gboolean wifi_refresh_adapter_list(GObject* object, GError** error) {
    return RefreshUntilFound(object, error, &Adapter::RefreshAdapterList,
                             "Failed to refresh adapter list(%d)",
                             "Failed to refresh adapter list (%d)");
}

gboolean wifi_force_remove_all_adapters(GObject* object, GError** error) {
    if (object == nullptr) {
        return BadParameter(error);
    }
    // By name, so an adapter that refuses to go cannot hold the loop.
    std::vector<std::string> names;
    for (const auto& adapter : Adapter::GetList()) {
        names.push_back(adapter->GetName());
    }
    gboolean result = TRUE;
    for (const std::string& name : names) {
        Adapter* adapter = Adapter::GetAdapter(name);
        if (adapter != nullptr &&
            adapter->GetStatus() != vornwireless::wifi::WIFI_STATUS_DISABLED &&
            adapter->Terminate() != 0) {
            VORN_LOG(LOG_ERR, "Failed to terminate adapter [%s]", name.c_str());
        }
        if (Adapter::RemoveAdapter(name) != 0) {
            VORN_LOG(LOG_ERR, "Failed to remove [%s]", name.c_str());
            result = FALSE;
        }
    }
    return result;
}

gboolean wifi_get_connection_list(GObject* object, const char* ifname, char** config,
                                  GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    Adapter* adapter = FindAdapter(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    std::vector<wifiutils::ConnectionInfo> connections;
    Json::Value list(Json::arrayValue);
    if (adapter->LoadStationConnData(connections) != 0 ||
        wifiutils::ParseConnectionList(connections, list) != 0) {
        return WIFI_FAIL(error, "Failed to load connection list for interface(%s)", ifname);
    }
    return Reply(list, config);
}

gboolean wifi_get_connected_ap_info(GObject* object, const char* ifname, char** config,
                                    GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    const Adapter* adapter = FindAdapterForInterface(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    Json::Value info;
    if (wifiutils::GetConnectedAPInfo(adapter->GetConfig(), info) != 0) {
        return WIFI_FAIL(error, "Failed to load connected AP info for interface(%s)", ifname);
    }
    return Reply(info, config);
}

gboolean wifi_get_bridge_list(GObject* object, char** list, GError** error) {
    if (object == nullptr || list == nullptr) {
        return BadParameter(error);
    }
    Json::Value bridges(Json::arrayValue);
    for (const auto& bridge : BridgeBase::GetList()) {
        bridges.append(wifiutils::GetJsonValue(BridgeBase::GetBridge(bridge->GetName())));
    }
    return Reply(bridges, list);
}

gboolean wifi_get_bridge_config(GObject* object, const char* ifname, char** config,
                                GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    const BridgeBase* bridge = BridgeBase::GetBridge(ifname);
    if (bridge == nullptr) {
        return WIFI_FAIL(error, "Bridge is not found(%s)", ifname);
    }
    return Reply(wifiutils::GetJsonValue(bridge), config);
}

gboolean wifi_apply_bridge(GObject* object, const char* ifname, const char* config,
                           GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    BridgeBase* bridge = BridgeBase::GetBridge(ifname);
    if (bridge == nullptr) {
        return WIFI_FAIL(error, "Bridge is not found(%s)", ifname);
    }
    Json::Value json;
    BridgeConfig parsed;
    if (!vornwireless::utils::ParseJson(config, json) || wifiutils::GetConfig(json, parsed) != 0) {
        return WIFI_FAIL(error, "Failed to get config(%s)", ifname);
    }
    ReapplyGuestBridges(ifname, parsed);
    if (bridge->Apply(parsed) != 0) {
        return WIFI_FAIL(error, "Failed to apply config(%s)", ifname);
    }
    return TRUE;
}

gboolean wifi_scan_networks(GObject* object, const char* ifname, char** config, GError** error) {
    if (object == nullptr || ifname == nullptr || config == nullptr) {
        return BadParameter(error);
    }
    Adapter* adapter = FindAdapterForInterface(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    std::vector<AdapterConfig::StationInfo> stations;
    if (adapter->ScanNetworks(stations) != 0) {
        return WIFI_FAIL(error, "Failed to scan network for interface(%s)", ifname);
    }
    Json::Value networks(Json::arrayValue);
    for (const auto& station : stations) {
        networks.append(wifiutils::StationInfoToJson(station));
    }
    return Reply(networks, config);
}

gboolean wifi_refresh_wlan_slave_list(GObject* object, GError** error) {
    return RefreshUntilFound(object, error, &BridgeBase::RefreshWlanSlaveList,
                             "Failed to refresh Wlan Slave list(%d)",
                             "Failed to refresh Wlan Slave list(%d)");
}

gboolean wifi_enable_wps_with_pbc(GObject* object, const char* ifname, GError** error) {
    if (object == nullptr || ifname == nullptr) {
        return BadParameter(error);
    }
    Adapter* adapter = FindAdapterForInterface(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    if (adapter->EnableWPSWithPBC() != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable wps pbc(%s)", ifname);
        g_set_error(error, g_quark_from_static_string("error"), 1, "Failed to enable wps pbc (%s)",
                    ifname);
        return FALSE;
    }
    return TRUE;
}

gboolean wifi_enable_wps_with_pin_code(GObject* object, const char* ifname, const char* pin,
                                       GError** error) {
    if (object == nullptr || ifname == nullptr || pin == nullptr) {
        return BadParameter(error);
    }
    Adapter* adapter = FindAdapterForInterface(ifname, error);
    if (adapter == nullptr) {
        return FALSE;
    }
    if (adapter->EnableWPSWithPinCode(pin) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable wps pin (%s)(%s)", ifname, pin);
        g_set_error(error, g_quark_from_static_string("error"), 1,
                    "Failed to enable wps pin code (%s)(%s)", ifname, pin);
        return FALSE;
    }
    return TRUE;
}

gboolean wifi_switch_wifi_on_off(GObject* object, GError** error) {
    return RunOnAll(object, error, &Adapter::SwitchOnOff, "Failed to switch wifi on/off");
}

gboolean wifi_reset_to_default(GObject* object, GError** error) {
    return RunOnAll(object, error, &Adapter::ResetToDefault, "Failed to reset to default");
}

namespace vornwireless {
namespace dbus {

const char* const WifiServer::kIntrospection = R"(<node>
  <interface name="com.tessarin.wifi">
    <method name="GetAdapterList"><arg name="list" type="s" direction="out"/></method>
    <method name="GetAdapterConfig"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="out"/></method>
    <method name="GetAdapterCapability"><arg name="ifname" type="s" direction="in"/><arg name="capability" type="s" direction="out"/></method>
    <method name="GetAdapterStatus"><arg name="ifname" type="s" direction="in"/><arg name="status" type="s" direction="out"/></method>
    <method name="EnableAdapter"><arg name="ifname" type="s" direction="in"/></method>
    <method name="DisableAdapter"><arg name="ifname" type="s" direction="in"/></method>
    <method name="ExecSchedule"><arg name="ifname" type="s" direction="in"/></method>
    <method name="ApplyAdapter"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="in"/></method>
    <method name="SwitchTopology"><arg name="topology" type="s" direction="in"/></method>
    <method name="SwitchAdapterTopology"><arg name="ifname" type="s" direction="in"/><arg name="topology" type="s" direction="in"/></method>
    <method name="AddAdapter"><arg name="ifname" type="s" direction="in"/></method>
    <method name="RemoveAdapter"><arg name="ifname" type="s" direction="in"/></method>
    <method name="RefreshAdapterList"></method>
    <method name="ForceRemoveAllAdapters"></method>
    <method name="GetConnectionList"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="out"/></method>
    <method name="GetConnectedAPInfo"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="out"/></method>
    <method name="GetBridgeList"><arg name="list" type="s" direction="out"/></method>
    <method name="GetBridgeConfig"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="out"/></method>
    <method name="ApplyBridge"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="in"/></method>
    <method name="ScanNetworks"><arg name="ifname" type="s" direction="in"/><arg name="config" type="s" direction="out"/></method>
    <method name="RefreshWlanSlaveList"></method>
    <method name="EnableWPSWithPBC"><arg name="ifname" type="s" direction="in"/></method>
    <method name="EnableWPSWithPinCode"><arg name="ifname" type="s" direction="in"/><arg name="pin" type="s" direction="in"/></method>
    <method name="SwitchWifiOnOff"></method>
    <method name="ResetToDefault"></method>
  </interface>
</node>)";

WifiServer::WifiServer()
    : DBusServer(kName, kPath, DBUS_BUS_SESSION),
      object_(static_cast<GObject*>(g_object_new(G_TYPE_OBJECT, nullptr))) {
    Initialize(kIntrospection,
               {
                   DBusMethod("GetAdapterList", &wifi_get_adapter_list),
                   DBusMethod("GetAdapterConfig", &wifi_get_adapter_config),
                   DBusMethod("GetAdapterCapability", &wifi_get_adapter_capability),
                   DBusMethod("GetAdapterStatus", &wifi_get_adapter_status),
                   DBusMethod("EnableAdapter", &wifi_enable_adapter),
                   DBusMethod("DisableAdapter", &wifi_disable_adapter),
                   DBusMethod("ExecSchedule", &wifi_exec_schedule),
                   DBusMethod("ApplyAdapter", &wifi_apply_adapter),
                   DBusMethod("SwitchTopology", &wifi_switch_topology),
                   DBusMethod("SwitchAdapterTopology", &wifi_switch_adapter_topology),
                   DBusMethod("AddAdapter", &wifi_add_adapter),
                   DBusMethod("RemoveAdapter", &wifi_remove_adapter),
                   DBusMethod("RefreshAdapterList", &wifi_refresh_adapter_list),
                   DBusMethod("ForceRemoveAllAdapters", &wifi_force_remove_all_adapters),
                   DBusMethod("GetConnectionList", &wifi_get_connection_list),
                   DBusMethod("GetConnectedAPInfo", &wifi_get_connected_ap_info),
                   DBusMethod("GetBridgeList", &wifi_get_bridge_list),
                   DBusMethod("GetBridgeConfig", &wifi_get_bridge_config),
                   DBusMethod("ApplyBridge", &wifi_apply_bridge),
                   DBusMethod("ScanNetworks", &wifi_scan_networks),
                   DBusMethod("RefreshWlanSlaveList", &wifi_refresh_wlan_slave_list),
                   DBusMethod("EnableWPSWithPBC", &wifi_enable_wps_with_pbc),
                   DBusMethod("EnableWPSWithPinCode", &wifi_enable_wps_with_pin_code),
                   DBusMethod("SwitchWifiOnOff", &wifi_switch_wifi_on_off),
                   DBusMethod("ResetToDefault", &wifi_reset_to_default),
               },
               object_);
}

WifiServer::~WifiServer() {
    g_object_unref(object_);
}

}  // namespace dbus
}  // namespace vornwireless
