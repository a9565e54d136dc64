// vornnetd: the network daemon. Runs the network modules and serves "com.tessarin.net".
#include <glib-unix.h>
#include <signal.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <string>

#include "dbus/net_server.h"
#include "network/module/module_manager.h"
#include "platform/root_path.h"
#include "utils/create_pid_file.h"
#include "utils/log.h"

namespace {

constexpr const char* kPidFile = "/var/run/vornnetd.pid";

void Usage(FILE* out) {
    std::fprintf(
        out,
        "Usage: vornnetd [--foreground] [--help] [--version]\n"
        "The network daemon of the Vorn appliance: runs the network modules (netlink\n"
        "monitor, gateway routes, LAN device list, IPv6 router advertisements) and serves\n"
        "their requests as \"com.tessarin.net\" at \"/\" on the session bus.\n"
        "\n"
        "  --foreground  stay attached and copy log lines to stderr\n"
        "  --help        show this text\n"
        "  --version     show the version\n"
        "\n"
        "Stops on SIGTERM or SIGINT. Paths and programs live under $VORN_ROOT when set.\n");
}

gboolean OnStopSignal(gpointer server) {
    VORN_LOG(LOG_INFO, "Stopping on signal");
    static_cast<vornnetwork::dbus::NetServer*>(server)->QuitLoop();
    return G_SOURCE_REMOVE;
}

void TerminateModules() {
    using vornnetwork::network::module::ModuleManager;
    ModuleManager* manager = ModuleManager::GetInstance();
    for (const auto& row : ModuleManager::module_info) {
        manager->RemoveModule(row.type);
    }
}

}  // namespace

int main(int argc, char** argv) {
    bool foreground = false;
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "--foreground") == 0) {
            foreground = true;
        } else if (std::strcmp(argv[i], "--help") == 0) {
            Usage(stdout);
            return 0;
        } else if (std::strcmp(argv[i], "--version") == 0) {
            std::printf("vornnetd 5.0.0\n");
            return 0;
        } else {
            std::fprintf(stderr, "vornnetd: unknown argument '%s'\n", argv[i]);
            Usage(stderr);
            return 2;
        }
    }

    openlog("vornnetd", LOG_PID, LOG_DAEMON);
    if (foreground) {
        vorn::log::SetSink(vorn::log::SyslogAndStderrSink);
    } else if (daemon(0, 0) != 0) {
        std::perror("vornnetd: daemon");
        return 1;
    }
    signal(SIGPIPE, SIG_IGN);
    vorn::platform::PrefixPathWithRoot();

    const int pidFile = vornwireless::utils::CreatePidFile(kPidFile);
    if (pidFile < 0) {
        std::fprintf(stderr, "vornnetd: cannot take %s: another vornnetd is running\n", kPidFile);
        VORN_LOG(LOG_ERR, "Another instance holds %s", kPidFile);
        return 1;
    }

    using vornnetwork::network::module::ModuleManager;
    ModuleManager* manager = ModuleManager::GetInstance();
    if (!manager->Initialize()) {
        VORN_LOG(LOG_ERR, "Not every network module could be initialized");
    }
    if (!manager->Start()) {
        VORN_LOG(LOG_ERR, "Not every network module could be started");
    }

    vornnetwork::dbus::NetServer server;
    if (!server.IsInitialized()) {
        std::fprintf(stderr, "vornnetd: cannot serve com.tessarin.net on the session bus\n");
        TerminateModules();
        unlink(vorn::platform::RootPath(kPidFile).c_str());
        return 1;
    }
    g_unix_signal_add(SIGTERM, OnStopSignal, &server);
    g_unix_signal_add(SIGINT, OnStopSignal, &server);
    VORN_LOG(LOG_INFO, "Serving com.tessarin.net");
    server.StartLoop();

    TerminateModules();
    unlink(vorn::platform::RootPath(kPidFile).c_str());
    close(pidFile);
    VORN_LOG(LOG_INFO, "Stopped");
    return 0;
}
