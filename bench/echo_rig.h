#ifndef VORN_BENCH_ECHO_RIG_H
#define VORN_BENCH_ECHO_RIG_H

#include <gio/gio.h>

#include <functional>
#include <memory>
#include <string>

#include "support/private_bus.h"
#include "support/sim_root.h"

namespace vorn {
namespace bench {

constexpr char kNetService[] = "com.tessarin.net";
constexpr char kEchoService[] = "com.tessarin.bench.echo";

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

}  // namespace bench
}  // namespace vorn

#endif
