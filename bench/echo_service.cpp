// The baseline of the D-Bus benchmarks: the service VORN_ECHO_NAME at "/" on the session bus, with
// one method Echo(s) -> (s), served by plain GDBus. Stops on SIGTERM.
//
// Built twice: the plain echo answers its argument; with VORN_ECHO_JSON it reads the argument as
// JSON and writes it back with jsoncpp, the least a daemon of the appliance does, so that its
// memory shows what the C++ runtime and jsoncpp alone cost.
#include <gio/gio.h>
#include <glib-unix.h>
#include <signal.h>

#include <cstdio>

#ifdef VORN_ECHO_JSON
#include <json/json.h>

#include <sstream>
#include <string>
#endif

namespace {

constexpr char kName[] = VORN_ECHO_NAME;
constexpr char kIntrospection[] =
    "<node><interface name='" VORN_ECHO_NAME
    "'>"
    "<method name='Echo'>"
    "<arg name='text' type='s' direction='in'/><arg name='text' type='s' direction='out'/>"
    "</method></interface></node>";

#ifdef VORN_ECHO_JSON
std::string JsonEcho(const char* text) {
    Json::Value value;
    std::istringstream in(text);
    std::string errors;
    if (!Json::parseFromStream(Json::CharReaderBuilder(), in, &value, &errors)) {
        return errors;
    }
    return Json::writeString(Json::StreamWriterBuilder(), value);
}
#endif

void OnMethodCall(GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*,
                  GVariant* parameters, GDBusMethodInvocation* invocation, gpointer) {
    const gchar* text = nullptr;
    g_variant_get(parameters, "(&s)", &text);
#ifdef VORN_ECHO_JSON
    const std::string answer = JsonEcho(text);
    text = answer.c_str();
#endif
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
