// Sequential round trips of "GetAdapterConfig" to vornwifid against those of the minimal GDBus
// echo service on the same private bus, measured alternately in one run so that the ratio holds
// across machines; and the private memory of each right after start. vornwifid runs over the
// rig's simulated root (router topology, the radio wlan0) with vornnetd beside it.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "echo_rig.h"

namespace {

using vorn::bench::EchoRig;
using vorn::bench::Memory;

constexpr char kWifiService[] = "com.tessarin.wifi";
constexpr char kAdapter[] = "wlan0";

EchoRig* rig = nullptr;
std::unique_ptr<vorn::test::DaemonProcess> vornwifid;
Memory vornwifidMemory;
Memory echoMemory;
Memory jsonEchoMemory;

void BM_SequentialRoundTrips(benchmark::State& state) {
    using Clock = std::chrono::steady_clock;
    Clock::duration wifi{};
    Clock::duration echo{};
    for (auto _ : state) {
        const auto start = Clock::now();
        const std::string config =
            vorn::bench::CallText(*rig, kWifiService, "GetAdapterConfig", kAdapter);
        const auto middle = Clock::now();
        const std::string echoed =
            vorn::bench::CallText(*rig, vorn::bench::kEchoService, "Echo", kAdapter);
        echo += Clock::now() - middle;
        wifi += middle - start;
        if (config.find("\"name\" : \"wlan0\"") == std::string::npos || echoed != kAdapter) {
            state.SkipWithError(("unexpected answers: " + config + " / " + echoed).c_str());
            return;
        }
    }
    const double calls = static_cast<double>(state.iterations());
    const double wifiRate = calls / std::chrono::duration<double>(wifi).count();
    const double echoRate = calls / std::chrono::duration<double>(echo).count();
    state.counters["vornwifid_calls_per_s"] = wifiRate;
    state.counters["echo_calls_per_s"] = echoRate;
    state.counters["vornwifid_vs_echo"] = wifiRate / echoRate;
}
BENCHMARK(BM_SequentialRoundTrips)->Unit(benchmark::kMicrosecond);

// Reads nothing itself: reports what each process used right after start.
void BM_MemoryAfterStart(benchmark::State& state) {
    for (auto _ : state) {
    }
    vorn::bench::SetMemoryComparison(state, "vornwifid", vornwifidMemory, echoMemory,
                                     jsonEchoMemory);
}
BENCHMARK(BM_MemoryAfterStart)->Iterations(1);

}  // namespace

int main(int argc, char** argv) {
    const int status = vorn::bench::RunWithRig(argc, argv, rig, [](EchoRig& started) {
        started.root.Scenario("iwconfig",
                              "when wlan0*\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
        vornwifid = std::make_unique<vorn::test::DaemonProcess>(
            std::vector<std::string>{VORN_BINARY_DIR "/daemons/vornwifid", "--foreground"});
        if (!vornwifid->WaitForBusName(kWifiService, std::chrono::seconds(60))) {
            std::fprintf(stderr, "vornwifid did not start:\n%s", vornwifid->Stderr().c_str());
        }
        vornwifidMemory = vorn::bench::ReadMemory(vornwifid->Pid());
        echoMemory = vorn::bench::ReadMemory(started.echo.Pid());
        jsonEchoMemory = vorn::bench::JsonEchoMemory();
    });
    vornwifid.reset();
    return status;
}
