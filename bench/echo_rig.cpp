#include "echo_rig.h"

#include <benchmark/benchmark.h>

#include <cstdio>

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

}  // namespace bench
}  // namespace vorn
