#ifndef VORN_DBUS_WIFI_SERVER_H
#define VORN_DBUS_WIFI_SERVER_H

#include <glib-object.h>

#include "dbus/dbus_server.h"

namespace vornwireless {
namespace dbus {

// The wifi daemon's service "com.tessarin.wifi" at "/" on the session bus: adapters, bridges and
// the topology, every answer a JSON text.
class WifiServer : public DBusServer {
  public:
    WifiServer();
    ~WifiServer() override;

    static const char* const kIntrospection;

  private:
    GObject* object_;
};

}  // namespace dbus
}  // namespace vornwireless

// The method handlers.
gboolean wifi_get_adapter_list(GObject* object, char** list, GError** error);
gboolean wifi_get_adapter_config(GObject* object, const char* ifname, char** config,
                                 GError** error);
gboolean wifi_get_adapter_capability(GObject* object, const char* ifname, char** capability,
                                     GError** error);
gboolean wifi_get_adapter_status(GObject* object, const char* ifname, char** status,
                                 GError** error);
gboolean wifi_enable_adapter(GObject* object, const char* ifname, GError** error);
gboolean wifi_disable_adapter(GObject* object, const char* ifname, GError** error);
gboolean wifi_exec_schedule(GObject* object, const char* ifname, GError** error);
gboolean wifi_apply_adapter(GObject* object, const char* ifname, const char* config,
                            GError** error);
gboolean wifi_switch_topology(GObject* object, const char* topology, GError** error);
gboolean wifi_switch_adapter_topology(GObject* object, const char* ifname, const char* topology,
                                      GError** error);
gboolean wifi_add_adapter(GObject* object, const char* ifname, GError** error);
gboolean wifi_remove_adapter(GObject* object, const char* ifname, GError** error);
gboolean wifi_refresh_adapter_list(GObject* object, GError** error);
gboolean wifi_force_remove_all_adapters(GObject* object, GError** error);
gboolean wifi_get_connection_list(GObject* object, const char* ifname, char** config,
                                  GError** error);
gboolean wifi_get_connected_ap_info(GObject* object, const char* ifname, char** config,
                                    GError** error);
gboolean wifi_get_bridge_list(GObject* object, char** list, GError** error);
gboolean wifi_get_bridge_config(GObject* object, const char* ifname, char** config, GError** error);
gboolean wifi_apply_bridge(GObject* object, const char* ifname, const char* config, GError** error);
gboolean wifi_scan_networks(GObject* object, const char* ifname, char** config, GError** error);
gboolean wifi_refresh_wlan_slave_list(GObject* object, GError** error);
gboolean wifi_enable_wps_with_pbc(GObject* object, const char* ifname, GError** error);
gboolean wifi_enable_wps_with_pin_code(GObject* object, const char* ifname, const char* pin,
                                       GError** error);
gboolean wifi_switch_wifi_on_off(GObject* object, GError** error);
gboolean wifi_reset_to_default(GObject* object, GError** error);

#endif
