#include "dbus/dbus_server.h"

#include <exception>

#include "dbus/dbus_client.h"
#include "utils/log.h"

namespace vornwireless {
namespace dbus {
namespace {

constexpr const char* kBusName = "org.freedesktop.DBus";
constexpr const char* kBusPath = "/org/freedesktop/DBus";

std::string OrEmpty(const gchar* text) {
    return text != nullptr ? text : "";
}

}  // namespace

DBusServer::DBusServer(const char* name, const char* path, DBusBusType bus)
    : name_(name != nullptr ? name : ""), path_(path != nullptr ? path : "") {
    GError* error = nullptr;
    connection_ = g_bus_get_sync(ToGBusType(bus), nullptr, &error);
    if (connection_ == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to get bus connection");
        g_clear_error(&error);
        return;
    }
    busProxy_ = g_dbus_proxy_new_sync(
        connection_,
        static_cast<GDBusProxyFlags>(G_DBUS_PROXY_FLAGS_DO_NOT_LOAD_PROPERTIES |
                                     G_DBUS_PROXY_FLAGS_DO_NOT_CONNECT_SIGNALS),
        nullptr, kBusName, kBusPath, kBusName, nullptr, &error);
    if (busProxy_ == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to get bus proxy");
        g_clear_error(&error);
    }
}

DBusServer::~DBusServer() {
    if (registration_ != 0) {
        g_dbus_connection_unregister_object(connection_, registration_);
    }
    if (node_ != nullptr) {
        g_dbus_node_info_unref(node_);
    }
    if (busProxy_ != nullptr) {
        g_object_unref(busProxy_);
    }
    if (connection_ != nullptr) {
        g_object_unref(connection_);
    }
}

bool DBusServer::HasHandlersFor(const GDBusInterfaceInfo* interface) const {
    for (GDBusMethodInfo** info = interface->methods; info != nullptr && *info != nullptr; ++info) {
        int in = 0;
        int out = 0;
        while ((*info)->in_args != nullptr && (*info)->in_args[in] != nullptr) {
            ++in;
        }
        while ((*info)->out_args != nullptr && (*info)->out_args[out] != nullptr) {
            ++out;
        }
        bool found = false;
        for (const DBusMethod& method : methods_) {
            found = found || (method.Name() == (*info)->name && method.InCount() == in &&
                              method.OutCount() == out);
        }
        if (!found) {
            VORN_LOG(LOG_ERR, "No handler for method %s", (*info)->name);
            return false;
        }
    }
    return true;
}

bool DBusServer::RequestName() {
    if (busProxy_ == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to acquire %s", name_.c_str());
        return false;
    }
    GError* error = nullptr;
    // The answer (owner, queued, exists) is not examined: a call that succeeds counts.
    GVariant* reply =
        g_dbus_proxy_call_sync(busProxy_, "RequestName", g_variant_new("(su)", name_.c_str(), 0u),
                               G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
    if (reply == nullptr) {
        if (error != nullptr) {
            VORN_LOG(LOG_ERR, "Failed to acquire %s: %s", name_.c_str(), error->message);
        } else {
            VORN_LOG(LOG_ERR, "Failed to acquire %s", name_.c_str());
        }
        g_clear_error(&error);
        return false;
    }
    g_variant_unref(reply);
    return true;
}

bool DBusServer::Initialize(const char* introspectionXml, const std::vector<DBusMethod>& methods,
                            GObject* object) {
    if (connection_ == nullptr || initialized_) {
        return initialized_;
    }
    GError* error = nullptr;
    node_ = g_dbus_node_info_new_for_xml(introspectionXml, &error);
    if (node_ == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to parse introspection data: %s", error->message);
        g_clear_error(&error);
        return false;
    }
    GDBusInterfaceInfo* interface = g_dbus_node_info_lookup_interface(node_, name_.c_str());
    methods_ = methods;
    if (interface == nullptr) {
        VORN_LOG(LOG_ERR, "No interface %s in introspection data", name_.c_str());
        return false;
    }
    if (!HasHandlersFor(interface) || !RequestName()) {
        return false;
    }
    static const GDBusInterfaceVTable vtable = {&DBusServer::OnMethodCall, nullptr, nullptr, {}};
    object_ = object;
    registration_ = g_dbus_connection_register_object(connection_, path_.c_str(), interface,
                                                      &vtable, this, nullptr, &error);
    if (registration_ == 0) {
        VORN_LOG(LOG_ERR, "Failed to register object at %s: %s", path_.c_str(), error->message);
        g_clear_error(&error);
        return false;
    }
    initialized_ = true;
    return true;
}

void DBusServer::OnMethodCall(GDBusConnection*, const gchar*, const gchar*, const gchar*,
                              const gchar* methodName, GVariant* parameters,
                              GDBusMethodInvocation* invocation, gpointer self) {
    static_cast<DBusServer*>(self)->Dispatch(methodName, parameters, invocation);
}

void DBusServer::Dispatch(const gchar* methodName, GVariant* parameters,
                          GDBusMethodInvocation* invocation) {
    const DBusMethod* method = nullptr;
    for (const DBusMethod& candidate : methods_) {
        if (candidate.Name() == methodName) {
            method = &candidate;
        }
    }
    if (method == nullptr) {
        g_dbus_method_invocation_return_dbus_error(
            invocation, "org.freedesktop.DBus.Error.UnknownMethod", "Unknown method");
        return;
    }
    // The introspection data fixes the signature: every argument is a string.
    std::vector<const char*> args;
    for (gsize i = 0; i < g_variant_n_children(parameters); ++i) {
        GVariant* arg = g_variant_get_child_value(parameters, i);
        args.push_back(g_variant_get_string(arg, nullptr));
        g_variant_unref(arg);  // the string stays valid: parameters holds it
    }
    char* out = nullptr;
    GError* error = nullptr;
    gboolean ok = FALSE;
    try {
        ok = method->Invoke(object_, args, &out, &error);
    } catch (const std::exception& e) {
        VORN_LOG(LOG_ERR, "Handler of %s failed: %s", methodName, e.what());
        g_clear_error(&error);
        g_set_error_literal(&error, g_quark_from_static_string("error"), 1, "Internal error");
        ok = FALSE;
    }
    if (ok && method->OutCount() == 1 && out != nullptr && !g_utf8_validate(out, -1, nullptr)) {
        g_set_error_literal(&error, g_quark_from_static_string("error"), 1, "Invalid reply text");
        ok = FALSE;
    }
    if (ok) {
        g_dbus_method_invocation_return_value(
            invocation,
            method->OutCount() == 1 ? g_variant_new("(s)", out != nullptr ? out : "") : nullptr);
    } else if (error != nullptr) {
        g_dbus_method_invocation_return_gerror(invocation, error);
    } else {
        // What dbus-glib answered for a handler that failed without saying why.
        g_dbus_method_invocation_return_error(
            invocation, G_DBUS_ERROR, G_DBUS_ERROR_FAILED,
            "Method invoked for %s returned FALSE but did not set error", methodName);
    }
    g_clear_error(&error);
    g_free(out);
}

void DBusServer::StartLoop() {
    GMainLoop* loop = g_main_loop_new(nullptr, FALSE);
    GMainLoop* none = nullptr;
    if (!loop_.compare_exchange_strong(none, loop)) {
        g_main_loop_unref(loop);
        return;
    }
    g_main_loop_run(loop);
    loop_.store(nullptr);
    g_main_loop_unref(loop);
}

void DBusServer::QuitLoop() {
    GMainLoop* loop = loop_.exchange(nullptr);
    if (loop != nullptr) {
        g_main_loop_quit(loop);
    }
}

int DBusServer::NewSignal(const char* member) {
    if (member == nullptr) {
        VORN_LOG(LOG_ERR, "Method name is null");
        return -1;
    }
    signal_.clear();
    if (!g_dbus_is_member_name(member)) {
        VORN_LOG(LOG_ERR, "Failed to create message (%s)", member);
        return -1;
    }
    signal_ = member;
    return 0;
}

int DBusServer::SendSignal() {
    GError* error = nullptr;
    const bool sent =
        connection_ != nullptr && !signal_.empty() &&
        g_dbus_connection_emit_signal(connection_, nullptr, path_.c_str(), name_.c_str(),
                                      signal_.c_str(), nullptr, &error) &&
        g_dbus_connection_flush_sync(connection_, nullptr, &error);
    signal_.clear();
    g_clear_error(&error);
    if (!sent) {
        VORN_LOG(LOG_ERR, "Failed to send signal");
        return -1;
    }
    return 0;
}

std::string DBusServer::GetInterface() const {
    return busProxy_ != nullptr ? OrEmpty(g_dbus_proxy_get_interface_name(busProxy_)) : "";
}

std::string DBusServer::GetPath() const {
    return busProxy_ != nullptr ? OrEmpty(g_dbus_proxy_get_object_path(busProxy_)) : "";
}

std::string DBusServer::GetBusName() const {
    return busProxy_ != nullptr ? OrEmpty(g_dbus_proxy_get_name(busProxy_)) : "";
}

std::string DBusServer::GetConnectionName() const {
    return connection_ != nullptr ? OrEmpty(g_dbus_connection_get_unique_name(connection_)) : "";
}

}  // namespace dbus
}  // namespace vornwireless
