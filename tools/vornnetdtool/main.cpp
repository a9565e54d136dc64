// vornnetdtool: calls the methods of the network daemon's service from the command line, and
// manages the policy and static routes and the IPv6 routers in-process (the service has no methods
// for them).
#include <dirent.h>

#include <algorithm>
#include <cstdio>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "common/tool_cli.h"
#include "dbus/net_client.h"
#include "ipv6/router/router6_factory.h"
#include "network/route/policy_route.h"
#include "network/route/static_route.h"
#include "platform/qlibc_file.h"
#include "platform/root_path.h"
#include "utils/config.h"
#include "utils/json_text.h"
#include "utils/log.h"

namespace {

using vornnetwork::dbus::NetClient;
using vornnetwork::network::IP_TYPE;
using vornnetwork::network::IP_TYPE_V4;
using vornnetwork::network::IP_TYPE_V6;
using vornnetwork::network::PolicyRoute;
using vornnetwork::network::PolicyRouteRule;
using vornnetwork::network::StaticRoute;
using vornnetwork::network::StaticRouteRule;
using vornwireless::utils::ConfigSection;
using vornwireless::utils::ParseJson;

// How a command's argument becomes the method's argument.
enum class Argument {
    kText,         // passed as it is (a type word, a MAC, an interface name)
    kJson,         // a JSON object
    kGatewayType,  // v4, v6, all, or a JSON object
};

struct Command {
    const char* option;
    const char* operand;
    const char* help;
    Argument argument;
    // Runs the call; data receives the answer of methods that have one.
    std::function<int(NetClient&, const std::string& text, Json::Value& request, Json::Value& data)>
        call;
    bool hasAnswer;
};

const std::vector<Command>& Commands() {
    static const std::vector<Command> commands = {
        {"--get-device-list", "TYPE", "GetDeviceListData: the LAN devices found by a scanner type",
         Argument::kText,
         [](NetClient& c, const std::string& t, Json::Value&, Json::Value& d) {
             return c.GetDeviceListData(t, d);
         },
         true},
        {"--set-device-list", "JSON", "SetDeviceListData: name or type a device", Argument::kJson,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value&) {
             return c.SetDeviceListData(r);
         },
         false},
        {"--del-device-list", "MAC", "DelDeviceListData: forget a device", Argument::kText,
         [](NetClient& c, const std::string& t, Json::Value&, Json::Value&) {
             return c.DelDeviceListData(t);
         },
         false},
        {"--get-gateway-list", "v4|v6|JSON", "GetGatewayListData: the gateway candidates in order",
         Argument::kGatewayType,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value& d) {
             return c.GetGatewayListData(r, d);
         },
         true},
        {"--get-gateway", "JSON", "GetGatewayDataByInterface: one interface's gateway entry",
         Argument::kJson,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value& d) {
             return c.GetGatewayDataByInterface(r, d);
         },
         true},
        {"--add-gateway", "JSON", "AddGatewayData: add or update a gateway entry", Argument::kJson,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value&) {
             return c.AddGatewayData(r);
         },
         false},
        {"--del-gateway", "JSON", "DelGatewayData: remove an interface's gateway entry",
         Argument::kJson,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value&) {
             return c.DelGatewayData(r);
         },
         false},
        {"--set-slave", "JSON", "SetSlaveData: mark an interface as enslaved or not",
         Argument::kJson,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value&) {
             return c.SetSlaveData(r);
         },
         false},
        {"--copy-gateway", "JSON", "CopyGatewayData: copy an entry to another interface",
         Argument::kJson,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value&) {
             return c.CopyGatewayData(r);
         },
         false},
        {"--refresh-gateway", "v4|v6|all|JSON", "RefreshGateway: install the best default route",
         Argument::kGatewayType,
         [](NetClient& c, const std::string&, Json::Value& r, Json::Value&) {
             return c.RefreshGateway(r);
         },
         false},
        {"--reset-ipv6-module", "IFNAME",
         "ResetIPv6Module: apply the next router advertisement again", Argument::kText,
         [](NetClient& c, const std::string& t, Json::Value&, Json::Value&) {
             return c.ResetIPv6Module(t);
         },
         false},
    };
    return commands;
}

// Route commands: run in this process on the words after the option.
struct RouteCommand {
    const char* option;
    const char* operands;
    const char* help;
    size_t minWords;
    size_t maxWords;
    // 0 or more on success; usage errors return kUsageError. data is printed when not null.
    std::function<int(const std::vector<std::string>& words, Json::Value& data)> run;
};

constexpr int kUsageError = -1000;
const char kRouteConfigDir[] = "/etc/iproute2/config";

bool ParseFamily(const std::string& word, IP_TYPE& type) {
    if (word == "-4" || word == "-6") {
        type = word == "-4" ? IP_TYPE_V4 : IP_TYPE_V6;
        return true;
    }
    return false;
}

std::vector<IP_TYPE> Families(const std::vector<std::string>& words) {
    IP_TYPE type = IP_TYPE_V4;
    if (!words.empty() && ParseFamily(words[0], type)) {
        return {type};
    }
    return {IP_TYPE_V4, IP_TYPE_V6};
}

bool ParseObject(const std::string& text, Json::Value& value) {
    return ParseJson(text, value) && value.isObject();
}

// Owners of the interface rule files of a family ("eth0" for "eth0-table-rule"), static excluded.
std::vector<std::string> RuleFileOwners(IP_TYPE type) {
    std::vector<std::string> owners;
    DIR* dir = opendir(vorn::platform::RootPath(kRouteConfigDir).c_str());
    if (dir == nullptr) {
        return owners;
    }
    const std::string ending = type == IP_TYPE_V4 ? "-table-rule" : "-table-rule-v6";
    while (const dirent* entry = readdir(dir)) {
        const std::string name = entry->d_name;
        if (name.size() > ending.size() &&
            name.compare(name.size() - ending.size(), ending.size(), ending) == 0) {
            const std::string owner = name.substr(0, name.size() - ending.size());
            if (owner != "static" && vornnetwork::network::RuleFilePath(type, owner) ==
                                         std::string(kRouteConfigDir) + "/" + name) {
                owners.push_back(owner);
            }
        }
    }
    closedir(dir);
    return owners;
}

bool HasRule(IP_TYPE type, const std::string& owner, const std::string& name) {
    ConfigSection rules(vornnetwork::network::RuleFilePath(type, owner));
    return rules.Read() == 0 && rules.Find(name);
}

// --del-policy-route-rule -4|-6 NAME [IFNAME]: without IFNAME from every interface that has it.
int DeletePolicyRule(const std::vector<std::string>& words, Json::Value&) {
    IP_TYPE type = IP_TYPE_V4;
    if (!ParseFamily(words[0], type)) {
        return kUsageError;
    }
    PolicyRoute policy;
    if (words.size() == 3) {
        return policy.DeleteRule(type, words[2], words[1]);
    }
    int result = 0;
    for (const std::string& owner : RuleFileOwners(type)) {
        if (HasRule(type, owner, words[1]) && policy.DeleteRule(type, owner, words[1]) != 0) {
            result = -1;
        }
    }
    return result;
}

// --disable-route-table [-4|-6 [IFNAME]]: without IFNAME every interface table left without
// rules, as after --del-policy-route-rule.
int DisableRouteTable(const std::vector<std::string>& words, Json::Value&) {
    IP_TYPE type = IP_TYPE_V4;
    if (!words.empty() && !ParseFamily(words[0], type)) {
        return kUsageError;
    }
    PolicyRoute policy;
    if (words.size() == 2) {
        return policy.DisableTable(type, words[1]);
    }
    Json::Value enabled;
    if (policy.GetEnableTables(enabled) != 0) {
        return -1;
    }
    int result = 0;
    for (IP_TYPE family : Families(words)) {
        for (const Json::Value& table : enabled["tables"]) {
            const std::string owner = table["ifname"].asString();
            const bool on = table[family == IP_TYPE_V4 ? "enable" : "enable_v6"].asBool();
            if (on && owner != "static" &&
                policy.IsRulesEmpty(vornnetwork::network::RuleFilePath(family, owner)) &&
                policy.DisableTable(family, owner) != 0) {
                result = -1;
            }
        }
    }
    return result;
}

int AddPolicyRule(const std::vector<std::string>& words, Json::Value&) {
    IP_TYPE type = IP_TYPE_V4;
    Json::Value json;
    if (!ParseFamily(words[0], type) || !ParseObject(words[1], json)) {
        return kUsageError;
    }
    for (const char* key : {"ifname", "name", "ip", "mask", "prefix_length", "gateway"}) {
        if (!json[key].isNull() && !json[key].isString()) {
            return kUsageError;
        }
    }
    PolicyRouteRule rule;
    rule.type = type;
    rule.ifname = json["ifname"].asString();
    rule.name = json["name"].asString();
    rule.ip = json["ip"].asString();
    rule.mask = json["mask"].asString();
    rule.prefix_length = json["prefix_length"].asString();
    rule.gateway = json["gateway"].asString();
    return PolicyRoute().AddRule(rule);
}

int SetStaticRoutes(const std::vector<std::string>& words, Json::Value&) {
    IP_TYPE type = IP_TYPE_V4;
    Json::Value json;
    if (!ParseFamily(words[0], type) || !ParseObject(words[1], json)) {
        return kUsageError;
    }
    return StaticRoute().SetRules(type, json);
}

int ValidateStaticRoute(const std::vector<std::string>& words, Json::Value& data) {
    IP_TYPE type = IP_TYPE_V4;
    if (!ParseFamily(words[0], type) || !ParseObject(words[1], data)) {
        return kUsageError;
    }
    StaticRouteRule rule;
    if (StaticRoute::RuleFromJson(type, data, rule) != 0) {
        return -1;
    }
    return StaticRoute().TestRuleVaild(rule, data);
}

using vorn::network::ipv6::router::Router6Attr;
using vorn::network::ipv6::router::Router6Base;
using vorn::network::ipv6::router::Router6Factory;

// The stored settings with the LAN allocations beside them.
int ShowRouter6(const std::vector<std::string>& words, Json::Value& data) {
    Router6Attr attr(words[0], false);
    if (attr.LoadConfig() != 0) {
        return -1;
    }
    data = attr.ToJson();
    data["lan"] = Json::Value(Json::objectValue);
    for (const auto& lan : attr.lan) {
        data["lan"][lan.first] = lan.second;
    }
    return 0;
}

// The WAN's stored router when its settings differ from attr's, so that it can be taken back.
std::unique_ptr<Router6Base> ReplacedRouter6(const Router6Attr& attr) {
    Router6Attr stored(attr.wan, attr.is_default_gateway);
    if (QLIBCFileExist(stored.GetConfigName().c_str()) != 1 || stored.LoadConfig() != 0) {
        return nullptr;
    }
    stored.is_default_gateway = attr.is_default_gateway;
    return stored == attr ? nullptr : Router6Factory::newRouterV6InstanceImpl(stored);
}

// Checks the settings, takes back the WAN's router they replace and puts them into effect; the
// type "off" only takes the stored router back.
int SetRouter6(const std::vector<std::string>& words, Json::Value& data) {
    Json::Value json;
    if (!ParseObject(words[0], json) || !json["type"].isString() || !json["wan"].isString()) {
        return kUsageError;
    }
    const std::string type = json["type"].asString();
    if (type == "off") {
        const std::unique_ptr<Router6Base> stored =
            Router6Factory::newRouterV6Instance(json["wan"].asString());
        return stored != nullptr && stored->Destroy() ? 0 : -1;
    }
    const std::unique_ptr<Router6Base> router = Router6Factory::newRouterV6Instance(type, json);
    if (router == nullptr) {
        return -1;
    }
    const std::unique_ptr<Router6Base> replaced = ReplacedRouter6(router->Attr());
    if ((replaced != nullptr && !replaced->Destroy()) || !router->Create()) {
        return -1;
    }
    data = router->Attr().ToJson();
    return 0;
}

// Create or Destroy of the router stored for words[0].
int RunRouter6(const std::vector<std::string>& words, bool (Router6Base::*step)() const) {
    const std::unique_ptr<Router6Base> router = Router6Factory::newRouterV6Instance(words[0]);
    return router != nullptr && ((*router).*step)() ? 0 : -1;
}

const std::vector<RouteCommand>& RouteCommands() {
    static const std::vector<RouteCommand> commands = {
        {"--list-policy-tables", "", "the enabled policy tables", 0, 0,
         [](const std::vector<std::string>&, Json::Value& d) {
             return PolicyRoute().GetEnableTables(d);
         }},
        {"--enable-route-table", "-4|-6 IFNAME SOURCE[,SOURCE]",
         "route the sources (address, network or all) by IFNAME-table", 3, 3,
         [](const std::vector<std::string>& w, Json::Value&) {
             IP_TYPE type = IP_TYPE_V4;
             return ParseFamily(w[0], type) ? PolicyRoute().EnableTable(type, w[1], w[2])
                                            : kUsageError;
         }},
        {"--disable-route-table", "[-4|-6 [IFNAME]]",
         "disable IFNAME-table; without IFNAME every table left without rules", 0, 2,
         DisableRouteTable},
        {"--add-policy-route-rule", "-4|-6 JSON",
         "add or replace a rule of an interface table (JSON below)", 2, 2, AddPolicyRule},
        {"--del-policy-route-rule", "-4|-6 NAME [IFNAME]",
         "delete rule NAME of IFNAME, or of every interface", 2, 3, DeletePolicyRule},
        {"--set-static-routes", "-4|-6 JSON", "replace the static routes ({\"rules\":[...]})", 2, 2,
         SetStaticRoutes},
        {"--get-static-routes", "-4|-6", "the static routes with their \"active\" state", 1, 1,
         [](const std::vector<std::string>& w, Json::Value& d) {
             IP_TYPE type = IP_TYPE_V4;
             return ParseFamily(w[0], type) ? StaticRoute().GetRules(type, d) : kUsageError;
         }},
        {"--validate-static-route", "-4|-6 JSON",
         "try one route in the kernel; prints it with its network address", 2, 2,
         ValidateStaticRoute},
        {"--refresh-static-routes", "", "reinstall the stored static routes of both families", 0, 0,
         [](const std::vector<std::string>&, Json::Value&) {
             return StaticRoute().RefreshRules();
         }},
        {"--show-route-tables", "-4|-6 [TABLE]",
         "the routes of main, static-table and the enabled tables, or of TABLE", 1, 2,
         [](const std::vector<std::string>& w, Json::Value& d) {
             IP_TYPE type = IP_TYPE_V4;
             if (!ParseFamily(w[0], type)) {
                 return kUsageError;
             }
             StaticRoute routes;
             return w.size() == 1 ? routes.GetRouteTables(type, d)
                                  : routes.GetTableInfo(type, w[1], d);
         }},
        {"--show-ipv6-router", "WAN", "the stored IPv6 router of WAN with its LAN prefixes", 1, 1,
         ShowRouter6},
        {"--set-ipv6-router", "JSON",
         "check, store and start an IPv6 router (JSON below) in place of the WAN's own; type off "
         "stops and forgets it",
         1, 1, SetRouter6},
        {"--start-ipv6-router", "WAN", "put the stored IPv6 router of WAN into effect", 1, 1,
         [](const std::vector<std::string>& w, Json::Value&) {
             return RunRouter6(w, &Router6Base::Create);
         }},
        {"--stop-ipv6-router", "WAN", "take the IPv6 router of WAN back and forget its settings", 1,
         1,
         [](const std::vector<std::string>& w, Json::Value&) {
             return RunRouter6(w, &Router6Base::Destroy);
         }},
    };
    return commands;
}

constexpr const char* kDescription =
    "Calls the network daemon (com.tessarin.net on the session bus) and prints its answer as JSON\n"
    "(indented; one line with --compact). Exit status 0 on success, else the method's error\n"
    "number (1 when it has none), 2 for a usage error. Give one command.";

constexpr const char* kFooter =
    "A gateway type is v4 (\"GTYPE_V4\"), v6 (\"GTYPE_V6\") or all (\"ALL\").\n\n"
    "Example: vornnetdtool --add-gateway "
    "'{\"type\":\"GTYPE_V4\",\"ifname\":\"eth0\",\"priority\":0,\"gateway\":\"10.0.0.1\"}'\n\n"
    "A policy rule: {\"ifname\":\"eth0\",\"name\":\"lan\",\"ip\":\"10.1.0.0\","
    "\"mask\":\"255.255.0.0\",\"gateway\":\"10.0.0.1\"}\n"
    "  (IPv6: \"prefix_length\":\"64\" for \"mask\"; no \"ip\": the table's default route).\n\n"
    "A static route: {\"ip\":\"10.1.0.0\",\"mask\":\"255.255.0.0\",\"gateway\":\"10.0.0.1\","
    "\"ifname\":\"eth0\",\"enable\":true}.\n\n"
    "An IPv6 router: {\"type\":\"native\",\"wan\":\"eth0\",\"is_default_gateway\":true};\n"
    "  6in4 adds \"prefix\":\"2001:db8:1::/48\",\"remote_addr_v4\":\"198.51.100.1\",\n"
    "  \"local_addr_v6\":\"2001:db8::2/64\"; 6to4 needs only the wan; wan \"pppoe\" is the\n"
    "  current PPPoE interface.";

// Runs a route command on its operands; the exit status.
int RunRouteCommand(const RouteCommand& command, const std::vector<std::string>& operands,
                    bool compact) {
    Json::Value data;
    const int result = command.run(operands, data);
    if (result == kUsageError) {
        std::fprintf(stderr, "vornnetdtool: usage: %s %s\n", command.option, command.operands);
        return 2;
    }
    if (result < 0) {
        std::fprintf(stderr, "vornnetdtool: %s failed (%d)\n", command.option, result);
        return 1;
    }
    if (!data.isNull()) {
        vorn::tools::PrintJson(data, compact);
    }
    return 0;
}

bool BuildRequest(const Command& command, const std::string& text, Json::Value& request) {
    if (command.argument == Argument::kText) {
        return true;
    }
    if (command.argument == Argument::kGatewayType) {
        static const std::pair<const char*, const char*> kTypes[] = {
            {"v4", "GTYPE_V4"}, {"v6", "GTYPE_V6"}, {"all", "ALL"}};
        for (const auto& type : kTypes) {
            if (text == type.first) {
                request = Json::Value(Json::objectValue);
                request["type"] = type.second;
                return true;
            }
        }
    }
    return ParseJson(text, request) && request.isObject();
}

// Calls one method of the service; the exit status.
int RunServiceCommand(const Command& command, const std::string& text, bool compact) {
    Json::Value request;
    if (!BuildRequest(command, text, request)) {
        std::fprintf(stderr, "vornnetdtool: %s: '%s' is not a JSON object\n", command.option,
                     text.c_str());
        return 2;
    }
    NetClient client;
    Json::Value data;
    const int result = command.call(client, text, request, data);
    return vorn::tools::FinishCall("vornnetdtool", command.option, result,
                                   command.hasAnswer ? &data : nullptr, compact);
}

}  // namespace

int main(int argc, char** argv) {
    CLI::App app{kDescription};
    vorn::tools::SetUpApp(app, "vornnetdtool", "5.0.0");
    app.footer(kFooter);
    bool compact = false;
    bool ready = false;
    app.add_flag("--compact", compact, "print the answer on one line");
    const char* serviceGroup = "Service commands";
    const CLI::Option* readyOption =
        app.add_flag("--ready", ready, "exit 0 when vornnetd runs and owns its name")
            ->group(serviceGroup);
    std::vector<std::string> serviceText(Commands().size());
    std::vector<const CLI::Option*> serviceOptions;
    for (std::size_t i = 0; i < Commands().size(); ++i) {
        const Command& command = Commands()[i];
        serviceOptions.push_back(app.add_option(command.option, serviceText[i], command.help)
                                     ->type_name(command.operand)
                                     ->group(serviceGroup));
    }
    std::vector<std::vector<std::string>> routeWords(RouteCommands().size());
    std::vector<const CLI::Option*> routeOptions;
    for (std::size_t i = 0; i < RouteCommands().size(); ++i) {
        const RouteCommand& command = RouteCommands()[i];
        CLI::Option* option = command.maxWords == 0
                                  ? app.add_flag(command.option, command.help)
                                  : app.add_option(command.option, routeWords[i], command.help)
                                        ->type_name(command.operands)
                                        ->expected(static_cast<int>(command.minWords),
                                                   static_cast<int>(command.maxWords));
        routeOptions.push_back(option->group("Route commands (run here, not in vornnetd)"));
    }
    int status = 0;
    if (!vorn::tools::ParseCommandLine(app, argc, argv, "vornnetdtool", status)) {
        return status;
    }
    std::vector<const CLI::Option*> commands = serviceOptions;
    commands.insert(commands.end(), routeOptions.begin(), routeOptions.end());
    commands.push_back(readyOption);
    if (!vorn::tools::OneCommandGiven("vornnetdtool", commands)) {
        return 2;
    }
    vorn::tools::SendLogToStderr("vornnetdtool");
    if (ready) {
        return vorn::tools::ReportReady(NetClient().IsServerReady());
    }
    for (std::size_t i = 0; i < routeOptions.size(); ++i) {
        if (routeOptions[i]->count() > 0) {
            // An option given without its optional words holds one empty word.
            std::vector<std::string>& words = routeWords[i];
            words.erase(std::remove(words.begin(), words.end(), ""), words.end());
            return RunRouteCommand(RouteCommands()[i], words, compact);
        }
    }
    for (std::size_t i = 0; i < serviceOptions.size(); ++i) {
        if (serviceOptions[i]->count() > 0) {
            return RunServiceCommand(Commands()[i], serviceText[i], compact);
        }
    }
    return 2;
}
