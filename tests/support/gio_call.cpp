#include "support/gio_call.h"

namespace vorn {
namespace test {

ServiceAnswer CallService(const char* service, const char* method, GVariant* parameters,
                          std::chrono::milliseconds timeout) {
    ServiceAnswer answer;
    GError* error = nullptr;
    GDBusConnection* bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    GVariant* reply = nullptr;
    if (bus == nullptr) {
        g_variant_unref(g_variant_ref_sink(parameters));
    } else {
        reply = g_dbus_connection_call_sync(bus, service, "/", service, method, parameters, nullptr,
                                            G_DBUS_CALL_FLAGS_NONE,
                                            static_cast<int>(timeout.count()), nullptr, &error);
        g_object_unref(bus);
    }
    answer.ok = reply != nullptr;
    if (reply != nullptr) {
        if (g_variant_is_of_type(reply, G_VARIANT_TYPE("(s)"))) {
            const char* text = nullptr;
            g_variant_get(reply, "(&s)", &text);
            answer.text = text;
        }
        g_variant_unref(reply);
        return answer;
    }
    gchar* name = g_dbus_error_get_remote_error(error);
    answer.errorName = name != nullptr ? name : "";
    g_free(name);
    g_dbus_error_strip_remote_error(error);
    answer.text = error->message;
    g_error_free(error);
    return answer;
}

}  // namespace test
}  // namespace vorn
