#ifndef VORN_UTILS_DBUS_CLIENT_H
#define VORN_UTILS_DBUS_CLIENT_H

#include <string>

namespace vornwireless {
namespace utils {

// Gateway announcements to the network daemon's route module, one service call each. The
// wireless half never writes the gateway list itself.

// Adds or updates the gateway that ifname offers. true on success.
bool SetGatewayInfo(const std::string& ifname, const std::string& type, const std::string& gateway,
                    const std::string& dns, const std::string& gwClass, int priority, bool refresh);
bool DelGatewayInfo(const std::string& ifname, const std::string& type, bool refresh);
// The priority the route module holds for ifname (0 when its answer has none), -1 on failure.
int GetGatewayPriority(const std::string& ifname, const std::string& type);
// Makes the route module recompute the default gateway of type.
bool RefreshGateway(const std::string& type);
// Marks ifname's record as a bridge slave (a slave's gateway is never installed).
bool SetSlaveGatewayInfo(const std::string& ifname, const std::string& type, bool slave);
// Gives destination the record of source, at source's place; source's record goes when
// deleteSource is set.
bool CopyGatewayInfo(const std::string& type, const std::string& source,
                     const std::string& destination, bool deleteSource);

}  // namespace utils
}  // namespace vornwireless

#endif
