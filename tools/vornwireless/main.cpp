// vornwireless: calls the methods of the wifi daemon's service from the command line. The hourly
// crontab entry of a radio's schedule runs a copy of it with --exec-schedule.
#include <cstdio>
#include <functional>
#include <string>
#include <vector>

#include "common/tool_cli.h"
#include "dbus/wifi_client.h"
#include "utils/json_text.h"
#include "vornwireless/topology_guard.h"

namespace {

using vornwireless::dbus::WifiClient;
using Words = std::vector<std::string>;

struct Command {
    const char* option;
    const char* operands;
    const char* help;
    int words;
    // Runs the call; data receives the answer of methods that have one.
    std::function<int(WifiClient&, const Words&, Json::Value& data)> call;
    bool hasAnswer;
};

// A method taking the interface name and answering JSON.
Command Query(const char* option, const char* help,
              int (WifiClient::*method)(const std::string&, Json::Value&)) {
    return {
        option,
        "IFNAME",
        help,
        1,
        [method](WifiClient& c, const Words& w, Json::Value& d) { return (c.*method)(w[0], d); },
        true};
}

// A method taking the interface name, answering nothing.
Command Action(const char* option, const char* help,
               int (WifiClient::*method)(const std::string&)) {
    return {option,
            "IFNAME",
            help,
            1,
            [method](WifiClient& c, const Words& w, Json::Value&) { return (c.*method)(w[0]); },
            false};
}

// A method without arguments or answer.
Command Plain(const char* option, const char* help, int (WifiClient::*method)()) {
    return {option,
            "",
            help,
            0,
            [method](WifiClient& c, const Words&, Json::Value&) { return (c.*method)(); },
            false};
}

// A method taking the interface name and a JSON object.
Command Apply(const char* option, const char* help,
              int (WifiClient::*method)(const std::string&, const Json::Value&)) {
    return {
        option,
        "IFNAME JSON",
        help,
        2,
        [method](WifiClient& c, const Words& w, Json::Value& d) { return (c.*method)(w[0], d); },
        false};
}

const std::vector<Command>& Commands() {
    static const std::vector<Command> commands = {
        {"--get-adapter-list", "", "GetAdapterList: the managed wireless interfaces", 0,
         [](WifiClient& c, const Words&, Json::Value& d) { return c.GetAdapterList(d); }, true},
        Query("--get-adapter-config", "GetAdapterConfig: an adapter's settings",
              &WifiClient::GetAdapterConfig),
        Query("--get-adapter-capability", "GetAdapterCapability: what its radio can do",
              &WifiClient::GetAdapterCapability),
        Query("--get-adapter-status", "GetAdapterStatus: enabled, disabled, ...",
              &WifiClient::GetAdapterStatus),
        Query("--get-connection-list", "GetConnectionList: the stations on its access point",
              &WifiClient::GetConnectionList),
        Query("--get-connected-ap-info", "GetConnectedAPInfo: the network its station joined",
              &WifiClient::GetConnectedAPInfo),
        Query("--scan-networks", "ScanNetworks: the networks in reach", &WifiClient::ScanNetworks),
        Apply("--apply-adapter", "ApplyAdapter: new settings (the JSON of --get-adapter-config)",
              &WifiClient::ApplyAdapter),
        Action("--enable-adapter", "EnableAdapter: bring its service up",
               &WifiClient::EnableAdapter),
        Action("--disable-adapter", "DisableAdapter: take its service down",
               &WifiClient::DisableAdapter),
        Action("--exec-schedule", "ExecSchedule: switch it as its schedule says for this hour",
               &WifiClient::ExecSchedule),
        Action("--add-adapter", "AddAdapter: manage a wireless interface", &WifiClient::AddAdapter),
        Action("--remove-adapter", "RemoveAdapter: stop managing it", &WifiClient::RemoveAdapter),
        Action("--enable-wps-pbc", "EnableWPSWithPBC: WPS push button on its access point",
               &WifiClient::EnableWPSWithPBC),
        {"--enable-wps-pin", "IFNAME PIN", "EnableWPSWithPinCode: WPS with a 4 or 8 digit PIN", 2,
         [](WifiClient& c, const Words& w, Json::Value&) {
             return c.EnableWPSWithPinCode(w[0], w[1]);
         },
         false},
        {"--switch-adapter-topology", "IFNAME TOPOLOGY",
         "SwitchAdapterTopology: the adapters' topology (bridge, router, client, repeater)", 2,
         [](WifiClient& c, const Words& w, Json::Value&) {
             return c.SwitchAdapterTopology(w[0], w[1]);
         },
         false},
        {"--switch-topology", "TOPOLOGY",
         "SwitchTopology: the whole appliance's topology (bridge, router, client, repeater)", 1,
         [](WifiClient& c, const Words& w, Json::Value&) { return c.SwitchTopology(w[0]); }, false},
        {"--get-bridge-list", "", "GetBridgeList: the bridges of the topology", 0,
         [](WifiClient& c, const Words&, Json::Value& d) { return c.GetBridgeList(d); }, true},
        Query("--get-bridge-config", "GetBridgeConfig: a bridge's settings",
              &WifiClient::GetBridgeConfig),
        Apply("--apply-bridge", "ApplyBridge: new settings (the JSON of --get-bridge-config)",
              &WifiClient::ApplyBridge),
        Plain("--refresh-adapter-list", "RefreshAdapterList: follow the wireless interfaces",
              &WifiClient::RefreshAdapterList),
        Plain("--refresh-wlan-slave-list", "RefreshWlanSlaveList: put the radios into bridges",
              &WifiClient::RefreshWlanSlaveList),
        Plain("--force-remove-all-adapters", "ForceRemoveAllAdapters: stop managing every radio",
              &WifiClient::ForceRemoveAllAdapters),
        Plain("--switch-wifi-on-off", "SwitchWifiOnOff: the radio button",
              &WifiClient::SwitchWifiOnOff),
        Plain("--reset-to-default", "ResetToDefault: factory wifi settings",
              &WifiClient::ResetToDefault),
    };
    return commands;
}

constexpr const char* kDescription =
    "Calls the wifi daemon (com.tessarin.wifi on the session bus) and prints its answer as JSON\n"
    "(indented; one line with --compact). Exit status 0 on success, else the method's error\n"
    "number (1 when it has none), 2 for a usage error. Give one command.";

int Run(const Command& command, Words words, bool compact) {
    Json::Value data;
    if (command.words == 2 && std::string(command.operands).find("JSON") != std::string::npos &&
        !(vornwireless::utils::ParseJson(words[1], data) && data.isObject())) {
        std::fprintf(stderr, "vornwireless: %s: '%s' is not a JSON object\n", command.option,
                     words[1].c_str());
        return 2;
    }
    WifiClient client;
    // The crontab entry runs while nobody watches: say plainly why nothing happened.
    if (std::string(command.option) == "--exec-schedule" && !client.IsServerReady()) {
        std::fprintf(stderr, "vornwireless: the wifi daemon vornwifid is not running\n");
        return 1;
    }
    const int result = command.call(client, words, data);
    return vorn::tools::FinishCall("vornwireless", command.option, result,
                                   command.hasAnswer ? &data : nullptr, compact);
}

}  // namespace

int main(int argc, char** argv) {
    CLI::App app{kDescription};
    vorn::tools::SetUpApp(app, "vornwireless", "5.0.0");
    bool compact = false;
    bool ready = false;
    app.add_flag("--compact", compact, "print the answer on one line");
    const char* group = "Commands";
    const CLI::Option* readyOption =
        app.add_flag("--ready", ready, "exit 0 when vornwifid runs and owns its name")
            ->group(group);
    bool confirm = false;
    const CLI::Option* confirmOption =
        app.add_flag("--confirm", confirm, "confirm a switch made with --confirm-within")
            ->group(group);
    std::vector<Words> words(Commands().size());
    std::vector<const CLI::Option*> options;
    for (std::size_t i = 0; i < Commands().size(); ++i) {
        const Command& command = Commands()[i];
        CLI::Option* option = command.words == 0
                                  ? app.add_flag(command.option, command.help)
                                  : app.add_option(command.option, words[i], command.help)
                                        ->type_name(command.operands)
                                        ->expected(command.words);
        options.push_back(option->group(group));
    }
    int confirmWithin = 0;
    CLI::Option* guarded =
        app.add_option("--confirm-within", confirmWithin,
                       "with --switch-topology: switch back unless --confirm arrives in time")
            ->type_name("SECONDS")
            ->check(CLI::Range(1, 86400).description(""))
            ->needs(app.get_option("--switch-topology"));
    int status = 0;
    if (!vorn::tools::ParseCommandLine(app, argc, argv, "vornwireless", status)) {
        return status;
    }
    std::vector<const CLI::Option*> commands = options;
    commands.push_back(readyOption);
    commands.push_back(confirmOption);
    if (!vorn::tools::OneCommandGiven("vornwireless", commands)) {
        return 2;
    }
    vorn::tools::SendLogToStderr("vornwireless");
    if (ready) {
        return vorn::tools::ReportReady(WifiClient().IsServerReady());
    }
    if (confirm) {
        return vorn::tools::ConfirmSwitch();
    }
    if (guarded->count() > 0) {
        return vorn::tools::GuardedSwitch(app.get_option("--switch-topology")->as<std::string>(),
                                          confirmWithin);
    }
    for (std::size_t i = 0; i < options.size(); ++i) {
        if (options[i]->count() > 0) {
            return Run(Commands()[i], words[i], compact);
        }
    }
    return 2;
}
