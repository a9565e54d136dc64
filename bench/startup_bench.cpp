// Start-up: the time from starting each daemon to the moment it owns its bus name, against the
// minimal GDBus echo service's, on one private bus and a fresh simulated root. The bus tells this
// process of the new owner (NameOwnerChanged), so no polling interval is in the figures.
// vornwifid starts with vornnetd already running, as on the appliance.
#include <benchmark/benchmark.h>
#include <gio/gio.h>

#include <chrono>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "echo_rig.h"

namespace {

using Clock = std::chrono::steady_clock;
using vorn::test::DaemonProcess;

constexpr char kWifiService[] = "com.tessarin.wifi";
constexpr auto kStartTimeout = std::chrono::seconds(60);

GDBusConnection* connection = nullptr;
double echoSeconds = 0;  // mean start time of the echo service, measured first

// Runs this thread's own main context until name gets an owner or the timeout passes.
class OwnerWatch {
  public:
    explicit OwnerWatch(const char* name) : context_(g_main_context_new()) {
        g_main_context_push_thread_default(context_);
        subscription_ = g_dbus_connection_signal_subscribe(
            connection, "org.freedesktop.DBus", "org.freedesktop.DBus", "NameOwnerChanged",
            "/org/freedesktop/DBus", name, G_DBUS_SIGNAL_FLAGS_NONE, &OwnerWatch::OnChange, this,
            nullptr);
    }
    ~OwnerWatch() {
        g_dbus_connection_signal_unsubscribe(connection, subscription_);
        g_main_context_pop_thread_default(context_);
        g_main_context_unref(context_);
    }
    OwnerWatch(const OwnerWatch&) = delete;
    OwnerWatch& operator=(const OwnerWatch&) = delete;

    bool WaitOwned() {
        const auto deadline = Clock::now() + kStartTimeout;
        while (!owned_ && Clock::now() < deadline) {
            g_main_context_iteration(context_, FALSE);
        }
        return owned_;
    }

  private:
    static void OnChange(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                         GVariant* parameters, gpointer self) {
        const gchar* owner = nullptr;
        g_variant_get(parameters, "(&s&s&s)", nullptr, nullptr, &owner);
        static_cast<OwnerWatch*>(self)->owned_ = owner[0] != '\0';
    }

    GMainContext* context_;
    guint subscription_ = 0;
    bool owned_ = false;
};

// Starts the program once per iteration and stops it again; the time to its bus name is the
// iteration's time.
void MeasureStarts(benchmark::State& state, const std::vector<std::string>& argv,
                   const char* name) {
    double total = 0;
    for (auto _ : state) {
        OwnerWatch watch(name);
        const auto start = Clock::now();
        DaemonProcess daemon(argv);
        if (!watch.WaitOwned()) {
            state.SkipWithError(("no bus name: " + daemon.Stderr()).c_str());
            return;
        }
        const double seconds = std::chrono::duration<double>(Clock::now() - start).count();
        state.SetIterationTime(seconds);
        total += seconds;
    }
    const double mean = total / static_cast<double>(state.iterations());
    if (name == std::string(vorn::bench::kEchoService)) {
        echoSeconds = mean;
    } else if (echoSeconds > 0) {
        state.counters["vs_echo"] = mean / echoSeconds;
    }
}

void BM_StartEcho(benchmark::State& state) {
    MeasureStarts(state, {VORN_ECHO_SERVICE}, vorn::bench::kEchoService);
}
BENCHMARK(BM_StartEcho)->UseManualTime()->Iterations(10)->Unit(benchmark::kMillisecond);

void BM_StartVornnetd(benchmark::State& state) {
    MeasureStarts(state, {VORN_BINARY_DIR "/daemons/vornnetd", "--foreground"},
                  vorn::bench::kNetService);
}
BENCHMARK(BM_StartVornnetd)->UseManualTime()->Iterations(10)->Unit(benchmark::kMillisecond);

void BM_StartVornwifid(benchmark::State& state) {
    DaemonProcess vornnetd({VORN_BINARY_DIR "/daemons/vornnetd", "--foreground"});
    if (!vornnetd.WaitForBusName(vorn::bench::kNetService, kStartTimeout)) {
        state.SkipWithError(("vornnetd did not start: " + vornnetd.Stderr()).c_str());
        return;
    }
    MeasureStarts(state, {VORN_BINARY_DIR "/daemons/vornwifid", "--foreground"}, kWifiService);
}
BENCHMARK(BM_StartVornwifid)->UseManualTime()->Iterations(10)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return 1;
    }
    vorn::test::PrivateBus bus;
    vorn::test::SimRoot root;
    root.Scenario("iwconfig", "when wlan0*\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
    connection = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    if (!bus.Started() || connection == nullptr) {
        std::fprintf(stderr, "no private bus\n");
        return 1;
    }
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    g_object_unref(connection);
    return 0;
}
