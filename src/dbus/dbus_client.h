#ifndef VORN_DBUS_DBUS_CLIENT_H
#define VORN_DBUS_DBUS_CLIENT_H

#include <gio/gio.h>

#include <string>
#include <vector>

#include "dbus/dbus_bus_type.h"

namespace vornwireless {
namespace dbus {

// Builds and sends one method call at a time and reads its string or string-array reply. A
// failed call returns the negative of the first number in the error reply's message (-1 when it
// holds none): services put numbers in their messages for callers to see.
class DBusClient {
  public:
    DBusClient(const char* name, const char* path, const char* interface, DBusBusType bus);
    virtual ~DBusClient();
    DBusClient(const DBusClient&) = delete;
    DBusClient& operator=(const DBusClient&) = delete;

    virtual bool IsServerReady() const;

    int NewMessage(const char* method);
    int Append(const char* value);
    int Append(const std::string& value) { return Append(value.c_str()); }
    int Append(bool value);
    int SendMessage(bool waitReply, int timeoutMs);
    int GetReply(std::string& out);
    int GetReply(std::vector<std::string>& out);

    // A diagnostic: waits for ever for the service's "Hola" signal and logs each one.
    void AddSignalHandler();

    // The error number of an error reply's own message text (any remote-error prefix removed).
    static int ErrorNumber(const char* message);

  protected:
    DBusBusType GetBusType() const { return bus_; }
    // A reply is held: the last blocking SendMessage got one (an error reply is none), and it was
    // not read yet.
    bool HasReply() const { return reply_ != nullptr; }

  private:
    void DropMessage();
    void DropReply();

    std::string name_;
    std::string path_;
    std::string interface_;
    DBusBusType bus_;
    GDBusConnection* connection_ = nullptr;
    // The call being built: its method and its argument values (owned references).
    std::string method_;
    std::vector<GVariant*> args_;
    bool building_ = false;
    GVariant* reply_ = nullptr;
};

// The GIO bus of a bus type.
GBusType ToGBusType(DBusBusType bus);

}  // namespace dbus
}  // namespace vornwireless

#endif
