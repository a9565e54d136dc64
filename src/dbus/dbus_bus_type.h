#ifndef VORN_DBUS_DBUS_BUS_TYPE_H
#define VORN_DBUS_DBUS_BUS_TYPE_H

namespace vornwireless {
namespace dbus {

// Which bus a client or server uses; the values are those of libdbus.
enum DBusBusType {
    DBUS_BUS_SESSION = 0,
    DBUS_BUS_SYSTEM = 1,
    DBUS_BUS_STARTER = 2,
};

}  // namespace dbus
}  // namespace vornwireless

#endif
