// vornwifid: the wifi daemon. Brings up the bridges and adapters of the stored topology and serves
// "com.tessarin.wifi".
#include <glib-unix.h>
#include <malloc.h>
#include <signal.h>
#include <sys/timerfd.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <string>
#include <thread>

#include "dbus/net_client.h"
#include "dbus/wifi_server.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "utils/log.h"
#include "utils/service_daemon.h"
#include "wifi/adapter/adapter.h"
#include "wifi/bridge/bridge_base.h"

namespace {

using vornwireless::wifi::Adapter;

constexpr const char* kTopologyLock = "/tmp/topology.lock";
constexpr const char* kEventDaemonPidFile = "/var/run/evmond.pid";
constexpr std::chrono::seconds kNetServiceWait{10};
constexpr std::chrono::milliseconds kNetServicePoll{250};

constexpr const char* kDescription =
    "The wifi daemon of the Vorn appliance: brings up the bridges and wireless adapters\n"
    "of the stored network topology and serves their requests as \"com.tessarin.wifi\"\n"
    "at \"/\" on the session bus. Needs vornnetd for the bridges' gateway records.\n";

gboolean OnStopSignal(gpointer server) {
    VORN_LOG(LOG_INFO, "Stopping on signal");
    static_cast<vornwireless::dbus::WifiServer*>(server)->QuitLoop();
    return G_SOURCE_REMOVE;
}

// What a crash in the middle of a topology switch leaves behind: its lock file and a frozen
// event daemon.
void ClearInterruptedSwitch() {
    if (unlink(vorn::platform::RootPath(kTopologyLock).c_str()) == 0) {
        VORN_LOG(LOG_INFO, "Removed stale %s", kTopologyLock);
    }
    if (QLIBCProcAlive(QLIBCReadPidFile(kEventDaemonPidFile)) == 1 &&
        QLIBCProcSignalByPidFile(kEventDaemonPidFile, SIGCONT) != 0) {
        VORN_LOG(LOG_ERR, "Failed to continue evmond");
    }
}

// The bridges announce their gateway records to vornnetd; started together, it may still be
// coming up.
void WaitForNetService() {
    const auto deadline = std::chrono::steady_clock::now() + kNetServiceWait;
    while (!vornnetwork::dbus::NetClient().IsServerReady()) {
        if (std::chrono::steady_clock::now() >= deadline) {
            VORN_LOG(LOG_ERR, "vornnetd does not serve com.tessarin.net: bridges start without it");
            return;
        }
        std::this_thread::sleep_for(kNetServicePoll);
    }
}

// The radios as the week's tables say now, rather than at the next hourly run.
void ExecSchedules() {
    for (const auto& adapter : Adapter::GetList()) {
        const auto config = adapter->GetConfig();
        if ((config.schedule_enabled || config.guest_schedule_enabled) &&
            adapter->ExecSchedule() != 0) {
            VORN_LOG(LOG_ERR, "Failed to execute schedule(%s)", adapter->GetName().c_str());
        }
    }
}

// A timer that never expires but is cancelled whenever the wall clock is set.
bool ArmClockJumpTimer(int fd) {
    itimerspec never{};
    never.it_value.tv_sec = INT32_MAX;
    return timerfd_settime(fd, TFD_TIMER_ABSTIME | TFD_TIMER_CANCEL_ON_SET, &never, nullptr) == 0;
}

gboolean OnClockJump(gint fd, GIOCondition, gpointer) {
    std::uint64_t expirations = 0;
    // A set clock fails the read with ECANCELED; the timer needs arming again either way.
    if (read(fd, &expirations, sizeof(expirations)) < 0 && errno == ECANCELED) {
        VORN_LOG(LOG_INFO, "Wall clock changed: applying the schedules");
        ExecSchedules();
    }
    if (!ArmClockJumpTimer(fd)) {
        VORN_LOG(LOG_ERR, "Failed to watch the wall clock");
        return G_SOURCE_REMOVE;
    }
    return G_SOURCE_CONTINUE;
}

void StartWifi() {
    ClearInterruptedSwitch();
    WaitForNetService();
    if (vornwireless::wifi::BridgeBase::Initialize() != 0) {
        VORN_LOG(LOG_ERR, "Failed to initialize bridges");
    }
    if (Adapter::RefreshAdapterList() < 0) {
        VORN_LOG(LOG_ERR, "Failed to refresh adapter list");
    }
    ExecSchedules();
    // Start-up reads and writes every settings file; what it freed goes back to the system.
    malloc_trim(0);
}

}  // namespace

int main(int argc, char** argv) {
    vornwireless::utils::ServiceDaemon service("vornwifid", kDescription);
    const int status = service.Start(argc, argv);
    if (status >= 0) {
        return status;
    }

    StartWifi();

    vornwireless::dbus::WifiServer server;
    if (!server.IsInitialized()) {
        std::fprintf(stderr, "vornwifid: cannot serve com.tessarin.wifi on the session bus\n");
        return 1;
    }
    const int clockTimer = timerfd_create(CLOCK_REALTIME, TFD_NONBLOCK | TFD_CLOEXEC);
    if (clockTimer < 0 || !ArmClockJumpTimer(clockTimer)) {
        VORN_LOG(LOG_ERR, "Failed to watch the wall clock");
    } else {
        g_unix_fd_add(clockTimer, G_IO_IN, OnClockJump, nullptr);
    }
    g_unix_signal_add(SIGTERM, OnStopSignal, &server);
    g_unix_signal_add(SIGINT, OnStopSignal, &server);
    VORN_LOG(LOG_INFO, "Serving com.tessarin.wifi");
    server.StartLoop();

    if (clockTimer >= 0) {
        close(clockTimer);
    }
    VORN_LOG(LOG_INFO, "Stopped");
    return 0;
}
