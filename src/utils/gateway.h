#ifndef VORN_UTILS_GATEWAY_H
#define VORN_UTILS_GATEWAY_H

#include "utils/ip_address.h"

namespace vornwireless {
namespace utils {

// The system's default IPv4 gateway, running and configured, with one saved value to put back.
class Gateway {
  public:
    // System event codes of a gateway set where none was, removed, and changed.
    static constexpr unsigned int kEventSet = 0x1180130F;
    static constexpr unsigned int kEventRemoved = 0x11801310;
    static constexpr unsigned int kEventChanged = 0x11801311;

    virtual ~Gateway() = default;

    // Empty when there is none. 0 or -1.
    int Get(IPAddress& out) const;
    int GetConfig(IPAddress& out) const;
    // Saves the running gateway, or the configured one when none runs. -1 when both are empty.
    int Backup();
    // Makes gw (empty: none) the running and the configured gateway and records the change in
    // the system event log; nothing happens when both already are gw.
    int Set(const IPAddress& gw);
    // Sets the saved gateway again; -1 when nothing was saved.
    int Restore();

  private:
    IPAddress saved_;
};

}  // namespace utils
}  // namespace vornwireless

#endif
