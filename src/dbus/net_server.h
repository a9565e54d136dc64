#ifndef VORN_DBUS_NET_SERVER_H
#define VORN_DBUS_NET_SERVER_H

#include <glib-object.h>

#include "dbus/dbus_server.h"

namespace vornnetwork {
namespace dbus {

// The network daemon's service "com.tessarin.net" at "/" on the session bus: each method becomes
// one JSON request to the module manager.
class NetServer : public vornwireless::dbus::DBusServer {
  public:
    NetServer();
    ~NetServer() override;

    static const char* const kIntrospection;

  private:
    GObject* object_;
};

}  // namespace dbus
}  // namespace vornnetwork

// The method handlers.
gboolean net_get_device_list_data(GObject* object, const char* type, char** data, GError** error);
gboolean net_set_device_list_data(GObject* object, const char* data, GError** error);
gboolean net_del_device_list_data(GObject* object, const char* mac, GError** error);
gboolean net_get_gateway_list_data(GObject* object, const char* info, char** data, GError** error);
gboolean net_add_gateway_data(GObject* object, const char* info, GError** error);
gboolean net_del_gateway_data(GObject* object, const char* info, GError** error);
gboolean net_get_gateway_data_by_interface(GObject* object, const char* info, char** data,
                                           GError** error);
gboolean net_set_slave_data(GObject* object, const char* info, GError** error);
gboolean net_copy_gateway_data(GObject* object, const char* info, GError** error);
gboolean net_refresh_gateway(GObject* object, const char* type, GError** error);
gboolean net_reset_ipv6_module(GObject* object, const char* info, GError** error);

#endif
