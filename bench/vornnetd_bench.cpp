// Sequential round trips of "GetGatewayListData" to vornnetd against those of a minimal GDBus
// echo service on the same private bus, measured alternately in one run so that the ratio holds
// across machines; and the memory of each process right after start.
#include <benchmark/benchmark.h>
#include <gio/gio.h>

#include <chrono>
#include <string>

#include "echo_rig.h"

namespace {

constexpr char kRequest[] = R"({"type":"GTYPE_V4"})";
// What vornnetd's route module answers on a fresh root: an empty list.
constexpr char kNetAnswer[] = "[]\n";

using vorn::bench::EchoRig;
using vorn::bench::kEchoService;
using vorn::bench::kNetService;
using vorn::bench::Memory;
using vorn::bench::ReadMemory;
using vorn::bench::SetMemoryComparison;
using vorn::bench::SetMemoryCounters;

EchoRig* rig = nullptr;
// Each process's memory right after the rig started.
Memory busMemory;
Memory vornnetdMemory;
Memory echoMemory;
Memory jsonEchoMemory;

std::string Call(const char* service, const char* method) {
    return vorn::bench::CallText(*rig, service, method, kRequest);
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

// Reads nothing itself: reports what each process used right after start.
void BM_MemoryAfterStart(benchmark::State& state) {
    for (auto _ : state) {
    }
    SetMemoryComparison(state, "vornnetd", vornnetdMemory, echoMemory, jsonEchoMemory);
    SetMemoryCounters(state, "dbus_daemon", busMemory);
}
BENCHMARK(BM_MemoryAfterStart)->Iterations(1);

}  // namespace

int main(int argc, char** argv) {
    return vorn::bench::RunWithRig(argc, argv, rig, [](EchoRig& started) {
        busMemory = ReadMemory(started.bus.Pid());
        vornnetdMemory = ReadMemory(started.vornnetd.Pid());
        echoMemory = ReadMemory(started.echo.Pid());
        jsonEchoMemory = vorn::bench::JsonEchoMemory();
    });
}
