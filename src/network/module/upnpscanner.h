#ifndef VORN_NETWORK_MODULE_UPNPSCANNER_H
#define VORN_NETWORK_MODULE_UPNPSCANNER_H

#include <json/json.h>
#include <pthread.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string>

#include "network/module/clientlist.h"

namespace vornnetwork {
namespace network {
namespace module {

// Finds UPnP devices by an SSDP search ("ssdp:all") and lists each one under the source address
// of its answer, with the names its device description gives. A search runs on a short-lived
// detached thread, at most one at a time; GetData answers with what the last finished search found
// and starts the next one.
//
// Answers and description documents come from the network: texts are bounded and cleaned, a
// malformed document describes nothing, and the list holds at most kMaxDevices entries.
// libupnp's headers stay out of this one so that users of the library need not find them.
class UpnpScanner : public ClientList {
  public:
    static constexpr std::size_t kMaxDevices = 512;

    static UpnpScanner* Inst();

    // What the last finished search found; starts a search when none runs.
    Json::Value GetData();
    int Start() { return 0; }
    void Stop() {}

    int BoardcastUpnp();
    int StartUpnp();
    int StopUpnp();
    static bool IsSearching() { return searching_; }

    // Called on libupnp's threads for every answer and advertisement: downloads the description
    // at location and lists the device under ip.
    void HandleDiscovery(const std::string& ip, const std::string& location);
    // The names of a description document: "deviceType", "modelName", "modelDescription",
    // "friendlyName", "manufacturer" (empty when absent). False for an oversized or malformed one.
    static bool DescribeDevice(const std::string& description, Json::Value& device);

  private:
    explicit UpnpScanner(std::uint16_t port) : port_(port) {}
    static void* WaitBoardcastFinish(void* unused);
    bool IsFull();

    static std::atomic<bool> searching_;
    std::uint16_t port_;
    int handle_ = -1;  // libupnp's client handle
    pthread_t thread_{};
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
