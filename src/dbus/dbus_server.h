#ifndef VORN_DBUS_DBUS_SERVER_H
#define VORN_DBUS_DBUS_SERVER_H

#include <gio/gio.h>

#include <atomic>
#include <string>
#include <vector>

#include "dbus/dbus_bus_type.h"
#include "dbus/dbus_method.h"

namespace vornwireless {
namespace dbus {

// Owns a well-known name, exports one object whose interface (named like the service) comes from
// introspection XML, dispatches each call to its plain handler function and runs the main loop
// that serves the calls, one at a time.
class DBusServer {
  public:
    DBusServer(const char* name, const char* path, DBusBusType bus);
    virtual ~DBusServer();
    DBusServer(const DBusServer&) = delete;
    DBusServer& operator=(const DBusServer&) = delete;

    virtual void StartLoop();
    virtual void QuitLoop();
    virtual int NewSignal(const char* member);
    virtual int SendSignal();
    virtual bool IsInitialized() const { return initialized_; }

    // Checks that every method of the XML has a handler of its shape, asks for the name and
    // exports object at the path. False (logged) when any step fails.
    bool Initialize(const char* introspectionXml, const std::vector<DBusMethod>& methods,
                    GObject* object);

    // The bus daemon's interface, path and name, and this connection's unique name.
    std::string GetInterface() const;
    std::string GetPath() const;
    std::string GetBusName() const;
    std::string GetConnectionName() const;

  private:
    static void OnMethodCall(GDBusConnection* connection, const gchar* sender,
                             const gchar* objectPath, const gchar* interfaceName,
                             const gchar* methodName, GVariant* parameters,
                             GDBusMethodInvocation* invocation, gpointer self);
    void Dispatch(const gchar* methodName, GVariant* parameters, GDBusMethodInvocation* invocation);
    bool RequestName();
    bool HasHandlersFor(const GDBusInterfaceInfo* interface) const;

    std::atomic<GMainLoop*> loop_{nullptr};
    GDBusProxy* busProxy_ = nullptr;
    GDBusConnection* connection_ = nullptr;
    std::string name_;
    std::string path_;
    std::string signal_;
    bool initialized_ = false;
    GDBusNodeInfo* node_ = nullptr;
    guint registration_ = 0;
    std::vector<DBusMethod> methods_;
    GObject* object_ = nullptr;
};

}  // namespace dbus
}  // namespace vornwireless

#endif
