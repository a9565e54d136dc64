#include "dbus/dbus_method.h"

#include <utility>

#include "utils/log.h"

namespace vornwireless {
namespace dbus {

DBusMethod::DBusMethod(const char* name, int in, int out, Invoker invoke)
    : name_(name), in_(in), out_(out), invoke_(std::move(invoke)) {}

DBusMethod::DBusMethod(const char* name, NoArgs handler)
    : DBusMethod(name, 0, 0,
                 [handler](GObject* o, const std::vector<const char*>&, char**, GError** e) {
                     return handler(o, e);
                 }) {}

DBusMethod::DBusMethod(const char* name, Out handler)
    : DBusMethod(name, 0, 1,
                 [handler](GObject* o, const std::vector<const char*>&, char** out, GError** e) {
                     return handler(o, out, e);
                 }) {}

DBusMethod::DBusMethod(const char* name, In handler)
    : DBusMethod(name, 1, 0,
                 [handler](GObject* o, const std::vector<const char*>& a, char**, GError** e) {
                     return handler(o, a[0], e);
                 }) {}

DBusMethod::DBusMethod(const char* name, InOut handler)
    : DBusMethod(name, 1, 1,
                 [handler](GObject* o, const std::vector<const char*>& a, char** out, GError** e) {
                     return handler(o, a[0], out, e);
                 }) {}

DBusMethod::DBusMethod(const char* name, InIn handler)
    : DBusMethod(name, 2, 0,
                 [handler](GObject* o, const std::vector<const char*>& a, char**, GError** e) {
                     return handler(o, a[0], a[1], e);
                 }) {}

void SetHandlerError(GError** error, const char* domain, const char* text) {
    g_set_error_literal(error, g_quark_from_static_string(domain), 1, text);
}

gboolean BadParameter(GError** error) {
    VORN_LOG(LOG_ERR, "Bad parameter");
    SetHandlerError(error, "badparameter", "Bad parameter");
    return FALSE;
}

}  // namespace dbus
}  // namespace vornwireless
