#ifndef VORN_DBUS_DBUS_METHOD_H
#define VORN_DBUS_DBUS_METHOD_H

#include <glib-object.h>

#include <functional>
#include <string>
#include <vector>

namespace vornwireless {
namespace dbus {

// One exported method: its name and the plain handler function that serves it. Handlers take
// the exported object, their string arguments, a place for their string result (g_malloc'ed, freed
// after sending) and the error to set; they return TRUE on success.
class DBusMethod {
  public:
    using NoArgs = gboolean (*)(GObject*, GError**);
    using Out = gboolean (*)(GObject*, char**, GError**);
    using In = gboolean (*)(GObject*, const char*, GError**);
    using InOut = gboolean (*)(GObject*, const char*, char**, GError**);
    using InIn = gboolean (*)(GObject*, const char*, const char*, GError**);

    DBusMethod(const char* name, NoArgs handler);
    DBusMethod(const char* name, Out handler);
    DBusMethod(const char* name, In handler);
    DBusMethod(const char* name, InOut handler);
    DBusMethod(const char* name, InIn handler);

    const std::string& Name() const { return name_; }
    int InCount() const { return in_; }
    int OutCount() const { return out_; }
    // args holds InCount() strings; out is set only when OutCount() is 1.
    gboolean Invoke(GObject* object, const std::vector<const char*>& args, char** out,
                    GError** error) const {
        return invoke_(object, args, out, error);
    }

  private:
    using Invoker =
        std::function<gboolean(GObject*, const std::vector<const char*>&, char**, GError**)>;
    DBusMethod(const char* name, int in, int out, Invoker invoke);

    std::string name_;
    int in_;
    int out_;
    Invoker invoke_;
};

// Sets a handler's error: code 1 in the domain quark ("badparameter" or "error"), text as given.
void SetHandlerError(GError** error, const char* domain, const char* text);
// A null object or argument: logs and answers "Bad parameter"; FALSE.
gboolean BadParameter(GError** error);

}  // namespace dbus
}  // namespace vornwireless

#endif
