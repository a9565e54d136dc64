#include "echo_rig.h"

#include <benchmark/benchmark.h>

#include <unistd.h>

#include <cstdio>
#include <fstream>
#include <sstream>

namespace vorn {
namespace bench {

bool EchoRig::Start() {
    const test::DaemonProcess::Timeout startTimeout{30000};
    if (!bus.Started() || !vornnetd.WaitForBusName(kNetService, startTimeout) ||
        !echo.WaitForBusName(kEchoService, startTimeout)) {
        std::fprintf(stderr, "cannot start the rig:\n%s%s", vornnetd.Stderr().c_str(),
                     echo.Stderr().c_str());
        return false;
    }
    connection.reset(g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr));
    return connection != nullptr;
}

int RunWithRig(int argc, char** argv, EchoRig*& rig, const std::function<void(EchoRig&)>& started) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return 1;
    }
    // Pages of a program or library just built stay dirty in the page cache until written back,
    // and would count as the daemons' private dirty memory.
    sync();
    EchoRig theRig;
    if (!theRig.Start()) {
        return 1;
    }
    if (started) {
        started(theRig);
    }
    rig = &theRig;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    rig = nullptr;
    return 0;
}

std::string CallText(EchoRig& rig, const char* service, const char* method,
                     const std::string& argument) {
    constexpr int kCallTimeoutMs = 10000;
    GError* error = nullptr;
    GVariant* reply = g_dbus_connection_call_sync(
        rig.connection.get(), service, "/", service, method, g_variant_new("(s)", argument.c_str()),
        nullptr, G_DBUS_CALL_FLAGS_NONE, kCallTimeoutMs, nullptr, &error);
    std::string text;
    if (reply != nullptr) {
        const char* answer = nullptr;
        g_variant_get(reply, "(&s)", &answer);
        text = answer;
        g_variant_unref(reply);
    } else {
        g_dbus_error_strip_remote_error(error);
        text = error->message;
        g_error_free(error);
    }
    return text;
}

Memory ReadMemory(pid_t pid) {
    std::ifstream in("/proc/" + std::to_string(pid) + "/smaps_rollup");
    Memory memory;
    long long clean = -1;
    long long dirty = -1;
    // The first line names the range; then "Key:   value kB" lines.
    for (std::string line; std::getline(in, line);) {
        std::istringstream fields(line);
        std::string key;
        long long kb = 0;
        if (!(fields >> key >> kb)) {
            continue;
        }
        if (key == "Rss:") {
            memory.rss = kb;
        } else if (key == "Pss:") {
            memory.pss = kb;
        } else if (key == "Private_Clean:") {
            clean = kb;
        } else if (key == "Private_Dirty:") {
            dirty = kb;
            memory.privateDirtyKb = kb;
        }
    }
    if (clean >= 0 && dirty >= 0) {
        memory.privateKb = clean + dirty;
    }
    return memory;
}

void SetMemoryCounters(benchmark::State& state, const std::string& process, const Memory& memory) {
    // In bytes, shown with 1024-based prefixes.
    const auto bytes = [](long long kb) {
        return benchmark::Counter(static_cast<double>(kb) * 1024, benchmark::Counter::kDefaults,
                                  benchmark::Counter::kIs1024);
    };
    state.counters[process + "_Rss"] = bytes(memory.rss);
    state.counters[process + "_Pss"] = bytes(memory.pss);
    state.counters[process + "_Private"] = bytes(memory.privateKb);
    state.counters[process + "_PrivateDirty"] = bytes(memory.privateDirtyKb);
}

Memory JsonEchoMemory() {
    test::DaemonProcess jsonEcho{{VORN_JSON_ECHO_SERVICE}};
    if (!jsonEcho.WaitForBusName(kJsonEchoService, test::DaemonProcess::Timeout{30000})) {
        std::fprintf(stderr, "cannot start the JSON echo:\n%s", jsonEcho.Stderr().c_str());
        return Memory{};
    }
    return ReadMemory(jsonEcho.Pid());
}

void SetMemoryComparison(benchmark::State& state, const std::string& process, const Memory& daemon,
                         const Memory& echo, const Memory& jsonEcho) {
    SetMemoryCounters(state, process, daemon);
    SetMemoryCounters(state, "echo", echo);
    SetMemoryCounters(state, "json_echo", jsonEcho);
    const auto ratio = [&daemon](const Memory& baseline) {
        return static_cast<double>(daemon.privateKb) / static_cast<double>(baseline.privateKb);
    };
    state.counters[process + "_vs_echo_private"] = ratio(echo);
    state.counters[process + "_vs_json_echo_private"] = ratio(jsonEcho);
}

}  // namespace bench
}  // namespace vorn
