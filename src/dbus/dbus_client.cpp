#include "dbus/dbus_client.h"

#include <cctype>
#include <climits>

#include "utils/log.h"

namespace vornwireless {
namespace dbus {

GBusType ToGBusType(DBusBusType bus) {
    switch (bus) {
        case DBUS_BUS_SYSTEM:
            return G_BUS_TYPE_SYSTEM;
        case DBUS_BUS_STARTER:
            return G_BUS_TYPE_STARTER;
        case DBUS_BUS_SESSION:
        default:
            return G_BUS_TYPE_SESSION;
    }
}

DBusClient::DBusClient(const char* name, const char* path, const char* interface, DBusBusType bus)
    : name_(name != nullptr ? name : ""),
      path_(path != nullptr ? path : ""),
      interface_(interface != nullptr ? interface : ""),
      bus_(bus) {
    GError* error = nullptr;
    connection_ = g_bus_get_sync(ToGBusType(bus), nullptr, &error);
    if (connection_ == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to get bus connection");
        g_clear_error(&error);
    }
}

DBusClient::~DBusClient() {
    DropMessage();
    DropReply();
    if (connection_ != nullptr) {
        g_object_unref(connection_);
    }
}

void DBusClient::DropMessage() {
    for (GVariant* arg : args_) {
        g_variant_unref(arg);
    }
    args_.clear();
    method_.clear();
    building_ = false;
}

void DBusClient::DropReply() {
    if (reply_ != nullptr) {
        g_variant_unref(reply_);
        reply_ = nullptr;
    }
}

int DBusClient::NewMessage(const char* method) {
    if (method == nullptr) {
        VORN_LOG(LOG_ERR, "Method name is null");
        return -1;
    }
    if (connection_ == nullptr) {
        return -1;
    }
    DropMessage();
    if (!g_dbus_is_member_name(method)) {
        VORN_LOG(LOG_ERR, "Failed to create message (%s)", method);
        return -1;
    }
    method_ = method;
    building_ = true;
    return 0;
}

int DBusClient::Append(const char* value) {
    if (!building_) {
        VORN_LOG(LOG_ERR, "Message is null");
        return -1;
    }
    if (value == nullptr || !g_utf8_validate(value, -1, nullptr)) {
        VORN_LOG(LOG_ERR, "Failed to append args (string:%s)", value != nullptr ? value : "(null)");
        return -1;
    }
    args_.push_back(g_variant_ref_sink(g_variant_new_string(value)));
    return 0;
}

int DBusClient::Append(bool value) {
    if (!building_) {
        VORN_LOG(LOG_ERR, "Message is null");
        return -1;
    }
    args_.push_back(g_variant_ref_sink(g_variant_new_boolean(value)));
    return 0;
}

int DBusClient::ErrorNumber(const char* message) {
    const char* p = message != nullptr ? message : "";
    while (*p != '\0' && !std::isdigit(static_cast<unsigned char>(*p))) {
        ++p;
    }
    if (*p == '\0') {
        return 1;
    }
    int number = 0;
    for (; std::isdigit(static_cast<unsigned char>(*p)); ++p) {
        const int digit = *p - '0';
        if (number > (INT_MAX - digit) / 10) {
            return INT_MAX;
        }
        number = number * 10 + digit;
    }
    return number;
}

int DBusClient::SendMessage(bool waitReply, int timeoutMs) {
    DropReply();
    if (!building_) {
        VORN_LOG(LOG_ERR, "Message is null");
        return -1;
    }
    GVariant* params = g_variant_new_tuple(args_.data(), args_.size());
    if (!waitReply) {
        GDBusMessage* message = g_dbus_message_new_method_call(name_.c_str(), path_.c_str(),
                                                               interface_.c_str(), method_.c_str());
        g_dbus_message_set_body(message, params);
        g_dbus_message_set_flags(message, G_DBUS_MESSAGE_FLAGS_NO_REPLY_EXPECTED);
        GError* error = nullptr;
        const gboolean sent =
            g_dbus_connection_send_message(connection_, message, G_DBUS_SEND_MESSAGE_FLAGS_NONE,
                                           nullptr, &error) &&
            g_dbus_connection_flush_sync(connection_, nullptr, &error);
        g_object_unref(message);
        if (!sent) {
            VORN_LOG(LOG_ERR, "Failed to send message");
            g_clear_error(&error);
            return -1;
        }
        return 0;
    }
    GError* error = nullptr;
    reply_ = g_dbus_connection_call_sync(connection_, name_.c_str(), path_.c_str(),
                                         interface_.c_str(), method_.c_str(), params, nullptr,
                                         G_DBUS_CALL_FLAGS_NONE, timeoutMs, nullptr, &error);
    if (reply_ != nullptr) {
        return 0;
    }
    // The reply's own text, without the "GDBus.Error:name: " prefix, whose digits are not ours.
    g_dbus_error_strip_remote_error(error);
    const char* text = error != nullptr ? error->message : "";
    const int number = -ErrorNumber(text);
    VORN_LOG(LOG_ERR, "Failed to send message: %s (%d)", text, number);
    g_clear_error(&error);
    return number;
}

int DBusClient::GetReply(std::string& out) {
    if (reply_ == nullptr) {
        VORN_LOG(LOG_ERR, "Reply message is null");
        return -1;
    }
    int result = -1;
    if (g_variant_n_children(reply_) == 0 || !g_variant_is_of_type(reply_, G_VARIANT_TYPE_TUPLE)) {
        VORN_LOG(LOG_ERR, "Replied value is not a string");
    } else {
        GVariant* first = g_variant_get_child_value(reply_, 0);
        if (!g_variant_is_of_type(first, G_VARIANT_TYPE_STRING)) {
            VORN_LOG(LOG_ERR, "Replied value is not a string");
        } else {
            out = g_variant_get_string(first, nullptr);
            result = 0;
        }
        g_variant_unref(first);
    }
    DropReply();
    return result;
}

int DBusClient::GetReply(std::vector<std::string>& out) {
    if (reply_ == nullptr) {
        VORN_LOG(LOG_ERR, "Reply message is null");
        return -1;
    }
    int result = -1;
    GVariant* first =
        g_variant_n_children(reply_) > 0 ? g_variant_get_child_value(reply_, 0) : nullptr;
    if (first == nullptr || !g_variant_is_of_type(first, G_VARIANT_TYPE_ARRAY)) {
        VORN_LOG(LOG_ERR, "Replied value is not an array ");
    } else {
        out.clear();
        GVariantIter iter;
        g_variant_iter_init(&iter, first);
        while (GVariant* item = g_variant_iter_next_value(&iter)) {
            if (g_variant_is_of_type(item, G_VARIANT_TYPE_STRING)) {
                out.emplace_back(g_variant_get_string(item, nullptr));
            }
            g_variant_unref(item);
        }
        result = 0;
    }
    if (first != nullptr) {
        g_variant_unref(first);
    }
    DropReply();
    return result;
}

bool DBusClient::IsServerReady() const {
    DBusClient bus("org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", bus_);
    std::vector<std::string> names;
    if (bus.NewMessage("ListNames") != 0 || bus.SendMessage(true, -1) != 0 ||
        bus.GetReply(names) != 0) {
        return false;
    }
    for (const auto& name : names) {
        if (name == name_) {
            return true;
        }
    }
    return false;
}

void DBusClient::AddSignalHandler() {
    if (connection_ == nullptr) {
        return;
    }
    g_dbus_connection_signal_subscribe(
        connection_, name_.c_str(), interface_.c_str(), "Hola", nullptr, nullptr,
        G_DBUS_SIGNAL_FLAGS_NONE,
        [](GDBusConnection*, const gchar*, const gchar*, const gchar*, const gchar*, GVariant*,
           gpointer) { VORN_LOG(LOG_ERR, "Hola!"); },
        nullptr, nullptr);
    GMainLoop* loop = g_main_loop_new(nullptr, FALSE);
    g_main_loop_run(loop);
    g_main_loop_unref(loop);
}

}  // namespace dbus
}  // namespace vornwireless
