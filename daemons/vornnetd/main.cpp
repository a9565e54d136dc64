// vornnetd: the network daemon. Runs the network modules and serves "com.tessarin.net".
#include <glib-unix.h>
#include <signal.h>

#include <cstdio>

#include "dbus/net_server.h"
#include "network/module/module_manager.h"
#include "utils/log.h"
#include "utils/service_daemon.h"

namespace {

constexpr const char* kDescription =
    "The network daemon of the Vorn appliance: runs the network modules (netlink\n"
    "monitor, gateway routes, LAN device list, IPv6 router advertisements) and serves\n"
    "their requests as \"com.tessarin.net\" at \"/\" on the session bus.\n";

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
    vornwireless::utils::ServiceDaemon service("vornnetd", kDescription);
    const int status = service.Start(argc, argv);
    if (status >= 0) {
        return status;
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
        return 1;
    }
    g_unix_signal_add(SIGTERM, OnStopSignal, &server);
    g_unix_signal_add(SIGINT, OnStopSignal, &server);
    VORN_LOG(LOG_INFO, "Serving com.tessarin.net");
    server.StartLoop();

    TerminateModules();
    VORN_LOG(LOG_INFO, "Stopped");
    return 0;
}
