// The baseline of the D-Bus benchmarks: "com.tessarin.bench.echo" at "/" on the session bus, with
// one method Echo(s) -> (s) that answers its argument, served by plain GDBus. Stops on SIGTERM.
#include <gio/gio.h>
#include <glib-unix.h>
#include <signal.h>

#include <cstdio>

namespace {

constexpr char kName[] = "com.tessarin.bench.echo";
constexpr char kIntrospection[] =
    "<node><interface name='com.tessarin.bench.echo'><method name='Echo'>"
    "<arg name='text' type='s' direction='in'/><arg name='text' type='s' direction='out'/>"
    "</method></interface></node>";

void OnMethodCall(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                  GVariant* parameters, GDBusMethodInvocation* invocation, gpointer) {
    const gchar* text = nullptr;
    g_variant_get(parameters, "(&s)", &text);
    g_dbus_method_invocation_return_value(invocation, g_variant_new("(s)", text));
}

gboolean OnStopSignal(gpointer loop) {
    g_main_loop_quit(static_cast<GMainLoop*>(loop));
    return G_SOURCE_REMOVE;
}

}  // namespace

int main() {
    GError* error = nullptr;
    GDBusConnection* bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    if (bus == nullptr) {
        std::fprintf(stderr, "echo_service: %s\n", error->message);
        g_error_free(error);
        return 1;
    }
    GDBusNodeInfo* node = g_dbus_node_info_new_for_xml(kIntrospection, nullptr);
    static const GDBusInterfaceVTable vtable = {OnMethodCall, nullptr, nullptr, {}};
    const guint object = g_dbus_connection_register_object(bus, "/", node->interfaces[0], &vtable,
                                                           nullptr, nullptr, &error);
    if (object == 0) {
        std::fprintf(stderr, "echo_service: %s\n", error->message);
        g_error_free(error);
        return 1;
    }
    // The name is asked for once the object is there, so that its owner can be called at once.
    const guint name = g_bus_own_name_on_connection(bus, kName, G_BUS_NAME_OWNER_FLAGS_NONE,
                                                    nullptr, nullptr, nullptr, nullptr);
    GMainLoop* loop = g_main_loop_new(nullptr, FALSE);
    g_unix_signal_add(SIGTERM, OnStopSignal, loop);
    g_main_loop_run(loop);

    g_main_loop_unref(loop);
    g_bus_unown_name(name);
    g_dbus_connection_unregister_object(bus, object);
    g_dbus_node_info_unref(node);
    g_object_unref(bus);
    return 0;
}
