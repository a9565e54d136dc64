#ifndef VORN_NETWORK_MODULE_NETLINK_MODULE_H
#define VORN_NETWORK_MODULE_NETLINK_MODULE_H

#include <linux/netlink.h>
#include <pthread.h>

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "network/module/base_module.h"

namespace vornnetwork {
namespace network {
namespace module {

// A value per interface name, with a default for names never set.
template <typename T>
class IFMap {
  public:
    explicit IFMap(const T& def) : default_(def) {}

    void Set(const std::string& ifname, const T& value) { map_[ifname] = value; }
    bool Contains(const std::string& ifname) const { return map_.count(ifname) != 0; }
    // The stored value, or the default for a name never set.
    const T& operator[](const std::string& ifname) const {
        const auto found = map_.find(ifname);
        return found == map_.end() ? default_ : found->second;
    }
    const std::map<std::string, T>& Entries() const { return map_; }

  private:
    T default_;
    std::map<std::string, T> map_;
};

// A copy of what the monitor remembers and how it fared, for diagnostics and tests.
struct NetlinkState {
    std::map<std::string, bool> links;
    // The last IPv4 address seen per interface, and every IPv4 address known to be present.
    std::map<std::string, std::string> ipv4;
    std::map<std::string, std::set<std::string>> ipv4Present;
    std::map<std::string, std::vector<std::string>> ipv6;
    std::uint64_t messages = 0;  // netlink messages read
    std::uint64_t overruns = 0;  // reads that failed with ENOBUFS: events were lost
    std::uint64_t reseeds = 0;
    bool reseedPending = false;
};

// Watches the kernel's link, address and main-table route notifications on a thread of its own,
// calls the platform's link handlers and runs the change hooks on real changes only.
//
// Lost notifications (a full receive buffer, ENOBUFS) are not replayed: the socket is drained and
// the memories are re-seeded from the system, at most once a second, so that later notifications
// are compared against the real state again.
class NetlinkModule : public BaseModule {
  public:
    using Clock = std::chrono::steady_clock;

    // now: the clock that spaces re-seeds; tests pass their own.
    explicit NetlinkModule(std::function<Clock::time_point()> now = &Clock::now);
    ~NetlinkModule() override;

    int InitialModule() override;
    int TerminateModule() override;
    int StartModule() override;
    // The polling thread's loop; returns only when there is no socket.
    virtual void StartPolling();

    static BaseModule* Create();

    // Seeds the link states and IPv4 addresses from the platform's interface list.
    int InitInterface();
    int AnalysisNetlinkMessage();
    // Handles what one read returned: the messages in length bytes at data (4-byte aligned).
    void DispatchMessages(const void* data, std::size_t length);
    int CheckNewLinkEvent(const nlmsghdr* msg);
    int CheckIPChangeEvent(const nlmsghdr* msg);
    int CheckRouteChangeEvent(const nlmsghdr* msg);
    int OnInterfaceStatusChange(const std::string& ifname, bool running, bool slave);
    void ProcessIPv4Event(const std::string& ifname, const std::string& addr, int prefixlen);
    void ProcessIPv6Event(const std::string& ifname, const std::string& addr, int prefixlen,
                          bool added);
    // After a failed read: lost events (ENOBUFS) drain the socket and call for a re-seed.
    void OnReadFailure(int error);
    // Re-seeds when one is called for and the last one is at least a second old.
    void ReseedIfDue();

    // Asks the platform to apply an interface's DHCP configuration again.
    int RequestDHCPIP(const std::string& ifname) const;

    NetlinkState Snapshot() const;

  private:
    static void* PollingThread(void* module);

    void OnIPv4Event(const std::string& ifname, const std::string& addr, int prefixlen, bool added);
    bool SeedIPv4Addresses();
    void SeedIPv6Addresses();
    int DrainSocket();
    int PollTimeoutMilliseconds() const;
    int SkipMalformed(const nlmsghdr* msg, const char* why);

    int fd_ = -1;
    pthread_t thread_{};
    IFMap<std::string> ipv4_;
    std::map<std::string, std::vector<std::string>> ipv6_;
    IFMap<bool> link_;

    bool polling_ = false;
    std::map<std::string, std::set<std::string>> ipv4Present_;
    std::function<Clock::time_point()> now_;
    std::optional<Clock::time_point> lastReseed_;
    bool reseedPending_ = false;
    std::uint64_t messages_ = 0;
    std::uint64_t overruns_ = 0;
    std::uint64_t reseeds_ = 0;
    // Held by the polling thread while it changes what Snapshot copies.
    mutable std::mutex stateMutex_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
