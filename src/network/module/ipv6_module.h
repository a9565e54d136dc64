#ifndef VORN_NETWORK_MODULE_IPV6_MODULE_H
#define VORN_NETWORK_MODULE_IPV6_MODULE_H

#include <netinet/in.h>
#include <pthread.h>
#include <sys/socket.h>

#include <atomic>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>

#include "network/module/base_module.h"

namespace vornnetwork {
namespace network {
namespace module {

// What was last applied on one interface from its router advertisements.
struct InterfaceContext {
    enum State {
        STATE_NONE = 0,      // nothing applied yet
        STATE_MANAGED = 1,   // stateful DHCPv6
        STATE_AUTOCONF = 2,  // autoconfiguration only
        STATE_OTHER = 3,     // stateless DHCPv6
    };

    std::string prefix;  // the last advertised prefix, empty when unknown
    int state = STATE_NONE;
};

// Listens for ICMPv6 router advertisements on all interfaces. For an interface that is not
// itself an IPv6 router, a change of what its routers advertise registers the advertising router
// as the interface's IPv6 gateway with the route module and switches the interface's IPv6
// configuration mode, once per change.
//
// Advertisements come from the network: a truncated one, one with a malformed option, bogus
// packet information or a sender that is not link-local is logged and dropped whole.
//
// The listening thread is woken and joined by TerminateModule (and by the destructor) before the
// socket is closed, so it never outlives the module. The contexts are shared with the D-Bus
// thread ("RESET_IPV6_MODULE") under a lock of their own.
class IPv6Module : public BaseModule {
  public:
    using Contexts = std::map<std::string, InterfaceContext>;

    IPv6Module();
    ~IPv6Module() override;

    // "RESET_IPV6_MODULE" forgets request["ifname"]'s context, so that the next advertisement
    // on it applies again. Always 0.
    int ProcessRequest(const Json::Value& request, Json::Value& answer) override;
    int InitialModule() override;
    int TerminateModule() override;
    int StartModule() override;

    static BaseModule* Create();

    void ProcessRA(const std::string& gateway, const std::string& prefix, const std::string& ifname,
                   bool managed, bool other);
    // Handles one received ICMPv6 message of len bytes, as the listening thread does.
    void HandlePacket(const unsigned char* buf, int len, const sockaddr_in6& from,
                      const in6_pktinfo& info);

    int open_icmpv6_socket();
    // Waits for and receives one message into buf (kPacketBytes). Its length, or -1 on failure
    // (also when woken to stop).
    int recv_rs_ra(unsigned char* buf, sockaddr_in6* from, in6_pktinfo** info);
    // The packet information among a received message's control data; null, logged, when it is
    // bogus or missing.
    static in6_pktinfo* FindPacketInfo(msghdr& message);
    // Writes the address text into text (INET6_ADDRSTRLEN bytes).
    static void print_addr(const in6_addr* addr, char* text);
    // Walks the options of a router advertisement and writes the prefix of its last prefix
    // information option into prefix (INET6_ADDRSTRLEN bytes; left as it is when there is none).
    // 0, or -1 for malformed options.
    static int print_prefix(const unsigned char* msg, int len, char* prefix);

    Contexts GetContexts() const;
    // Advertisements handed to ProcessRA so far.
    std::uint64_t AdvertisementsHandled() const { return advertisements_; }

    static constexpr int kPacketBytes = 1500;

  private:
    static void* ListeningThread(void* module);
    void Listen();
    void StopListening();
    void CloseSocket();
    // Sets the interface's context to (prefix, state) and tells whether the state changed; a new
    // prefix counts as a change.
    bool ChangeState(const std::string& ifname, const std::string& prefix, int state);
    void SetContext(const std::string& ifname, const InterfaceContext& context);
    void RegisterGateway(const std::string& gateway, const std::string& ifname);

    int fd_ = -1;
    Contexts contexts_;
    mutable std::mutex contextsMutex_;

    pthread_t thread_{};
    bool listening_ = false;
    std::atomic<bool> stopping_{false};
    int wakeFds_[2] = {-1, -1};  // a pipe: a byte written wakes the listening thread
    std::unique_ptr<unsigned char[]> control_;
    std::atomic<std::uint64_t> advertisements_{0};
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
