#include "vornwireless/topology_guard.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <thread>

#include "common/tool_cli.h"
#include "dbus/wifi_client.h"
#include "platform/root_path.h"
#include "wifi/utils/utils.h"

namespace vorn {
namespace tools {
namespace {

// Present while a switch waits; confirming removes it.
constexpr const char* kGuardFile = "/tmp/vornwireless.topology-guard";
constexpr std::chrono::milliseconds kPoll{200};
// A switch given up on half-way would leave the appliance switched without its way back, so the
// guard waits for it far longer than the clients' usual 25 s.
constexpr int kSwitchWaitMs = 300000;

}  // namespace

int GuardedSwitch(const std::string& topology, int seconds) {
    std::string before;
    if (vornwireless::wifi::utils::GetTopologyString(before) != 0 || before == "none") {
        std::fprintf(stderr,
                     "vornwireless: the current topology is unknown; nothing to go back to\n");
        return 1;
    }
    const std::string guard = platform::RootPath(kGuardFile);
    // A guard whose process is gone (killed, the appliance restarted) waits for nobody.
    int holder = 0;
    if (FILE* stale = std::fopen(guard.c_str(), "re")) {
        if (std::fscanf(stale, "%d", &holder) != 1 || holder <= 0 ||
            (kill(holder, 0) != 0 && errno == ESRCH)) {
            unlink(guard.c_str());
        }
        std::fclose(stale);
    }
    const int fd = open(guard.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644);
    if (fd < 0) {
        std::fprintf(stderr, "vornwireless: another guarded switch waits (%s)\n", guard.c_str());
        return 1;
    }
    dprintf(fd, "%d\n", static_cast<int>(getpid()));
    close(fd);
    // The person may lose the terminal with the network: the way back must not go with it.
    std::signal(SIGHUP, SIG_IGN);
    std::signal(SIGPIPE, SIG_IGN);

    vornwireless::dbus::WifiClient client;
    const int switched = client.SwitchTopology(topology, kSwitchWaitMs);
    if (switched != 0) {
        unlink(guard.c_str());
        return FinishCall("vornwireless", "--switch-topology", switched, nullptr, false);
    }
    std::printf("switched to %s; confirm within %d s with: vornwireless --confirm\n",
                topology.c_str(), seconds);
    std::fflush(stdout);
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
    while (std::chrono::steady_clock::now() < deadline) {
        if (access(guard.c_str(), F_OK) != 0) {
            std::printf("confirmed\n");
            return 0;
        }
        std::this_thread::sleep_for(kPoll);
    }
    unlink(guard.c_str());
    const int back = client.SwitchTopology(before, kSwitchWaitMs);
    std::fprintf(stderr, "vornwireless: no confirmation within %d s: %s back to %s\n", seconds,
                 back == 0 ? "switched" : "failed to switch", before.c_str());
    return back == 0 ? 1 : ExitStatus(back);
}

int ConfirmSwitch() {
    if (unlink(platform::RootPath(kGuardFile).c_str()) != 0) {
        std::fprintf(stderr, "vornwireless: no topology switch waits for confirmation\n");
        return 1;
    }
    std::printf("confirmed\n");
    return 0;
}

}  // namespace tools
}  // namespace vorn
