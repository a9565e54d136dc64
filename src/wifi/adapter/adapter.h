#ifndef VORN_WIFI_ADAPTER_ADAPTER_H
#define VORN_WIFI_ADAPTER_ADAPTER_H

#include "wifi/settings/enum.h"

namespace vornwireless {
namespace wifi {

// One wireless interface under management. So far only the process-wide topology.
class Adapter {
  public:
    // The topology, read from the settings on first use and then kept for the process; a failed
    // read is not kept, so the next call reads again.
    static WIFI_TOPOLOGY GetTopology();
    static bool IsTopology(WIFI_TOPOLOGY topology) { return GetTopology() == topology; }
    // Sets the kept value; the stored settings are the caller's to write.
    static void SwitchTopology(WIFI_TOPOLOGY topology);

  private:
    static WIFI_TOPOLOGY topology_;
};

}  // namespace wifi
}  // namespace vornwireless

#endif
