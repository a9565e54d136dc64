#ifndef VORN_BENCH_ECHO_RIG_H
#define VORN_BENCH_ECHO_RIG_H

#include <benchmark/benchmark.h>
#include <gio/gio.h>
#include <sys/types.h>

#include <functional>
#include <memory>
#include <string>

#include "support/private_bus.h"
#include "support/sim_root.h"

namespace vorn {
namespace bench {

constexpr char kNetService[] = "com.tessarin.net";
constexpr char kEchoService[] = "com.tessarin.bench.echo";
constexpr char kJsonEchoService[] = "com.tessarin.bench.jsonecho";

// vornnetd on a fresh simulated root and the minimal echo service (the baseline), on one private
// bus, with this process's connection; members go in reverse order, the connection before the bus.
struct EchoRig {
    test::PrivateBus bus;
    test::SimRoot root;
    test::DaemonProcess vornnetd{{VORN_BINARY_DIR "/daemons/vornnetd", "--foreground"}};
    test::DaemonProcess echo{{VORN_ECHO_SERVICE}};
    std::unique_ptr<GDBusConnection, decltype(&g_object_unref)> connection{nullptr,
                                                                           &g_object_unref};

    // False, with the daemons' error output printed, when either does not come up.
    bool Start();
};

// Starts the rig (then calls started, when given), runs the program's benchmarks with rig pointing
// at it, and stops it. The exit status of the benchmark program.
int RunWithRig(int argc, char** argv, EchoRig*& rig,
               const std::function<void(EchoRig&)>& started = nullptr);

// One blocking call with one text argument on the rig's connection: the reply's text, or the error
// reply's own message.
std::string CallText(EchoRig& rig, const char* service, const char* method,
                     const std::string& argument);

// Resident memory in kB from /proc/PID/smaps_rollup; -1 where unreadable.
struct Memory {
    long long rss = -1;
    long long pss = -1;
    long long privateKb = -1;  // Private_Clean + Private_Dirty
    // Written pages (heap, stacks, relocated data): what neither sharing nor reclaim takes back.
    // The clean part is mostly code that no other process of the moment has mapped.
    long long privateDirtyKb = -1;
};
Memory ReadMemory(pid_t pid);
// The counters PROCESS_Rss, _Pss, _Private and _PrivateDirty, in bytes.
void SetMemoryCounters(benchmark::State& state, const std::string& process, const Memory& memory);
// Starts the JSON echo on the current bus and reads its memory once it owns its name; it stops
// again before this returns. Rss -1 when it did not start.
Memory JsonEchoMemory();
// The counters of SetMemoryCounters for the daemon and both echo services, and the daemon's
// private memory as a ratio to each echo's: PROCESS_vs_echo_private, PROCESS_vs_json_echo_private.
void SetMemoryComparison(benchmark::State& state, const std::string& process, const Memory& daemon,
                         const Memory& echo, const Memory& jsonEcho);

}  // namespace bench
}  // namespace vorn

#endif
