// "AddGatewayData" followed by "RefreshGateway" through vornnetd on a simulated root, with 1, 10
// and 100 entries in the IPv4 gateway list, against round trips of a minimal GDBus echo service
// on the same private bus, measured alternately in one run so that the ratio holds across
// machines.
#include <benchmark/benchmark.h>
#include <gio/gio.h>

#include <chrono>
#include <cstdio>
#include <memory>
#include <string>

#include "echo_rig.h"

namespace {

constexpr int kCallTimeoutMs = 10000;

using vorn::bench::EchoRig;
using vorn::bench::kEchoService;
using vorn::bench::kNetService;

EchoRig* rig = nullptr;

// One blocking call; false, with the error's text in error, when it fails.
bool Call(const char* service, const char* method, const std::string& argument,
          std::string& error) {
    GError* failure = nullptr;
    GVariant* reply =
        g_dbus_connection_call_sync(rig->connection.get(), service, "/", service, method,
                                    g_variant_new("(s)", argument.c_str()), nullptr,
                                    G_DBUS_CALL_FLAGS_NONE, kCallTimeoutMs, nullptr, &failure);
    if (reply == nullptr) {
        error = std::string(method) + ": " + failure->message;
        g_error_free(failure);
        return false;
    }
    g_variant_unref(reply);
    return true;
}

std::string AddRequest(int index, const char* priority) {
    return R"({"type":"GTYPE_V4","ifname":"eth)" + std::to_string(index) + R"(","priority":)" +
           priority + R"(,"gateway":"10.0.)" + std::to_string(index % 250) + R"(.1"})";
}

void BM_AddAndRefresh(benchmark::State& state) {
    using Clock = std::chrono::steady_clock;
    const int entries = static_cast<int>(state.range(0));
    std::string error;
    // The list as the run finds it: from the previous size upwards, entries are only added.
    for (int i = 0; i < entries; ++i) {
        if (!Call(kNetService, "AddGatewayData", AddRequest(i, "-2"), error)) {
            state.SkipWithError(error.c_str());
            return;
        }
    }
    const std::string add = AddRequest(0, "-2");
    const std::string refresh = R"({"type":"GTYPE_V4"})";
    Clock::duration net{};
    Clock::duration echo{};
    for (auto _ : state) {
        const auto start = Clock::now();
        const bool ok = Call(kNetService, "AddGatewayData", add, error) &&
                        Call(kNetService, "RefreshGateway", refresh, error);
        const auto middle = Clock::now();
        const bool echoed = ok && Call(kEchoService, "Echo", add, error) &&
                            Call(kEchoService, "Echo", refresh, error);
        echo += Clock::now() - middle;
        net += middle - start;
        if (!echoed) {
            state.SkipWithError(error.c_str());
            return;
        }
    }
    const double requests = 2.0 * static_cast<double>(state.iterations());
    const double netRate = requests / std::chrono::duration<double>(net).count();
    const double echoRate = requests / std::chrono::duration<double>(echo).count();
    state.counters["vornnetd_requests_per_s"] = netRate;
    state.counters["echo_requests_per_s"] = echoRate;
    state.counters["vornnetd_vs_echo"] = netRate / echoRate;
}
BENCHMARK(BM_AddAndRefresh)->Arg(1)->Arg(10)->Arg(100)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    return vorn::bench::RunWithRig(argc, argv, rig);
}
