// vornnetdtool: calls the methods of the network daemon's service from the command line.
#include <cstdio>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "dbus/net_client.h"
#include "platform/root_path.h"
#include "utils/json_text.h"
#include "utils/log.h"

namespace {

using vornnetwork::dbus::NetClient;
using vornwireless::utils::CompactJson;
using vornwireless::utils::ParseJson;
using vornwireless::utils::StyledJson;

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

void Usage(FILE* out) {
    std::fprintf(out,
                 "Usage: vornnetdtool [--compact] COMMAND ARGUMENT\n"
                 "       vornnetdtool --ready | --help | --version\n"
                 "Calls the network daemon (com.tessarin.net on the session bus) and prints its\n"
                 "answer as JSON (indented; one line with --compact). Exit status 0 on success,\n"
                 "else the method's error number (1 when it has none), 2 for a usage error.\n\n"
                 "Commands:\n");
    for (const Command& command : Commands()) {
        std::fprintf(out, "  %s %-16s %s\n", command.option, command.operand, command.help);
    }
    std::fprintf(
        out,
        "  --ready                           exit 0 when vornnetd runs and owns its name\n\n"
        "A gateway type is v4 (\"GTYPE_V4\"), v6 (\"GTYPE_V6\") or all (\"ALL\").\n"
        "Example: vornnetdtool --add-gateway "
        "'{\"type\":\"GTYPE_V4\",\"ifname\":\"eth0\",\"priority\":0,\"gateway\":\"10.0.0.1\"}'\n");
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

int ExitStatus(int result) {
    if (result >= 0) {
        return 0;
    }
    return result < -125 ? 125 : -result;
}

}  // namespace

int main(int argc, char** argv) {
    bool compact = false;
    std::vector<std::string> words;
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "--compact") == 0) {
            compact = true;
        } else if (std::strcmp(argv[i], "--help") == 0) {
            Usage(stdout);
            return 0;
        } else if (std::strcmp(argv[i], "--version") == 0) {
            std::printf("vornnetdtool 5.0.0\n");
            return 0;
        } else {
            words.emplace_back(argv[i]);
        }
    }
    vorn::platform::PrefixPathWithRoot();
    // The library's failure lines (the service's error text among them) are the user's answer.
    openlog("vornnetdtool", LOG_PID, LOG_USER);
    vorn::log::SetSink([](int priority, const std::string& line) {
        vorn::log::SyslogSink(priority, line);
        if (priority <= LOG_WARNING) {
            std::fprintf(stderr, "vornnetdtool: %s\n", line.c_str());
        }
    });
    if (words.size() == 1 && words[0] == "--ready") {
        const bool ready = NetClient().IsServerReady();
        std::printf("%s\n", ready ? "ready" : "not ready");
        return ready ? 0 : 1;
    }
    const Command* command = nullptr;
    for (const Command& candidate : Commands()) {
        if (!words.empty() && words[0] == candidate.option) {
            command = &candidate;
        }
    }
    if (command == nullptr || words.size() != 2) {
        std::fprintf(
            stderr, "vornnetdtool: %s\n",
            words.empty() ? "no command given" : "unknown command or wrong number of arguments");
        Usage(stderr);
        return 2;
    }
    Json::Value request;
    if (!BuildRequest(*command, words[1], request)) {
        std::fprintf(stderr, "vornnetdtool: %s: '%s' is not a JSON object\n", command->option,
                     words[1].c_str());
        return 2;
    }
    NetClient client;
    Json::Value data;
    const int result = command->call(client, words[1], request, data);
    if (result < 0) {
        std::fprintf(stderr, "vornnetdtool: %s failed (%d)\n", command->option, result);
        return ExitStatus(result);
    }
    if (command->hasAnswer) {
        std::printf("%s", compact ? (CompactJson(data) + "\n").c_str() : StyledJson(data).c_str());
    }
    return 0;
}
