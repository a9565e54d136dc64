// Sequential round trips of "GetGatewayListData" to vornnetd against those of a minimal GDBus
// echo service on the same private bus, measured alternately in one run so that the ratio holds
// across machines; and the memory of each process right after start.
#include <benchmark/benchmark.h>
#include <gio/gio.h>

#include <chrono>
#include <cstdio>
#include <fstream>
#include <memory>
#include <sstream>
#include <string>

#include "echo_rig.h"

namespace {


constexpr char kRequest[] = R"({"type":"GTYPE_V4"})";
// What vornnetd's route module answers on a fresh root: an empty list.
constexpr char kNetAnswer[] = "[]\n";
constexpr int kCallTimeoutMs = 10000;

// Resident memory in kB from /proc/PID/smaps_rollup; -1 where unreadable.
struct Memory {
    long long rss = -1;
    long long pss = -1;
    long long privateKb = -1;  // Private_Clean + Private_Dirty
};

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
        }
    }
    if (clean >= 0 && dirty >= 0) {
        memory.privateKb = clean + dirty;
    }
    return memory;
}

using vorn::bench::EchoRig;
using vorn::bench::kEchoService;
using vorn::bench::kNetService;

EchoRig* rig = nullptr;
// Each process's memory right after the rig started.
Memory busMemory;
Memory vornnetdMemory;
Memory echoMemory;

// One blocking call with the request text; the reply's text or the error reply's own message.
std::string Call(const char* service, const char* method) {
    GError* error = nullptr;
    GVariant* reply = g_dbus_connection_call_sync(
        rig->connection.get(), service, "/", service, method, g_variant_new("(s)", kRequest),
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

void BM_SequentialRoundTrips(benchmark::State& state) {
    using Clock = std::chrono::steady_clock;
    Clock::duration net{};
    Clock::duration echo{};
    for (auto _ : state) {
        const auto start = Clock::now();
        const std::string netAnswer = Call(kNetService, "GetGatewayListData");
        const auto middle = Clock::now();
        const std::string echoAnswer = Call(kEchoService, "Echo");
        echo += Clock::now() - middle;
        net += middle - start;
        if (netAnswer != kNetAnswer || echoAnswer != kRequest) {
            state.SkipWithError(("unexpected answers: " + netAnswer + " / " + echoAnswer).c_str());
            return;
        }
    }
    const double calls = static_cast<double>(state.iterations());
    const double netRate = calls / std::chrono::duration<double>(net).count();
    const double echoRate = calls / std::chrono::duration<double>(echo).count();
    state.counters["vornnetd_calls_per_s"] = netRate;
    state.counters["echo_calls_per_s"] = echoRate;
    state.counters["vornnetd_vs_echo"] = netRate / echoRate;
}
BENCHMARK(BM_SequentialRoundTrips)->Unit(benchmark::kMicrosecond);

// In bytes, shown with 1024-based prefixes.
benchmark::Counter Bytes(long long kb) {
    return benchmark::Counter(static_cast<double>(kb) * 1024, benchmark::Counter::kDefaults,
                              benchmark::Counter::kIs1024);
}

void SetMemoryCounters(benchmark::State& state, const std::string& process, const Memory& memory) {
    state.counters[process + "_Rss"] = Bytes(memory.rss);
    state.counters[process + "_Pss"] = Bytes(memory.pss);
    state.counters[process + "_Private"] = Bytes(memory.privateKb);
}

// Reads nothing itself: reports what each process used right after start.
void BM_MemoryAfterStart(benchmark::State& state) {
    for (auto _ : state) {
    }
    SetMemoryCounters(state, "vornnetd", vornnetdMemory);
    SetMemoryCounters(state, "echo", echoMemory);
    SetMemoryCounters(state, "dbus_daemon", busMemory);
}
BENCHMARK(BM_MemoryAfterStart)->Iterations(1);

}  // namespace

int main(int argc, char** argv) {
    return vorn::bench::RunWithRig(argc, argv, rig, [](EchoRig& started) {
        busMemory = ReadMemory(started.bus.Pid());
        vornnetdMemory = ReadMemory(started.vornnetd.Pid());
        echoMemory = ReadMemory(started.echo.Pid());
    });
}
