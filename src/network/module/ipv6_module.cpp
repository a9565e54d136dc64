#include "network/module/ipv6_module.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <net/if.h>
#include <netinet/icmp6.h>
#include <poll.h>
#include <sys/uio.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>
#include <cstring>
#include <exception>
#include <new>

#include "network/module/module_manager.h"
#include "platform/qlibc_file.h"
#include "platform/vorn_net.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr std::size_t kControlBytes = 48;
static_assert(CMSG_SPACE(sizeof(in6_pktinfo)) <= kControlBytes,
              "the control buffer holds the packet information");
constexpr int kHopLimit = 255;
constexpr int kRouterAdvertHeaderBytes = sizeof(nd_router_advert);
constexpr int kOptionUnitBytes = 8;
constexpr std::uint8_t kManagedFlag = 0x80;
constexpr std::uint8_t kOtherFlag = 0x40;
constexpr int kKeyValueBytes = 256;
constexpr char kIfcfgPrefix[] = "/etc/sysconfig/network-scripts/ifcfg-";

bool SetOption(int fd, int level, int name, int value, const char* what) {
    if (setsockopt(fd, level, name, &value, sizeof(value)) < 0) {
        VORN_LOG(LOG_ERR, "Failed to setsockopt(%s)", what);
        return false;
    }
    return true;
}

// The interfaces on which the system routes itself, or that are not configured by
// advertisements.
bool IgnoresAdvertisements(const VORN_NET_IPV6_CONFIG& config, const char* ipv6Router,
                           const std::string& ifname) {
    return config.type == VORN_NET_IPV6_TYPE_ROUTER || config.type == VORN_NET_IPV6_TYPE_STATIC ||
           std::strncmp(ipv6Router, "yes", 3) == 0 || ifname == "lbr0";
}

int TargetState(bool managed, bool other) {
    if (managed) {
        return InterfaceContext::STATE_MANAGED;
    }
    return other ? InterfaceContext::STATE_OTHER : InterfaceContext::STATE_AUTOCONF;
}

int ConfigurationMode(int state) {
    if (state == InterfaceContext::STATE_MANAGED) {
        return VORN_NET_IPV6_MODE_MANAGED;
    }
    return state == InterfaceContext::STATE_OTHER ? VORN_NET_IPV6_MODE_OTHER
                                                  : VORN_NET_IPV6_MODE_AUTOCONF;
}

void CloseFd(int& fd) {
    if (fd >= 0) {
        close(fd);
        fd = -1;
    }
}

}  // namespace

IPv6Module::IPv6Module() : BaseModule(MODULE_IPV6) {}

IPv6Module::~IPv6Module() {
    StopListening();
    CloseSocket();
}

BaseModule* IPv6Module::Create() {
    return new (std::nothrow) IPv6Module();
}

int IPv6Module::ProcessRequest(const Json::Value& request, Json::Value& answer) {
    (void)answer;
    try {
        if (request.isObject() && request["method"].isString() &&
            request["method"].asString() == "RESET_IPV6_MODULE" && request["ifname"].isString()) {
            std::lock_guard<std::mutex> lock(contextsMutex_);
            contexts_.erase(request["ifname"].asString());
        }
    } catch (const std::exception& error) {
        VORN_LOG(LOG_ERR, "Failed to process request: %s", error.what());
    }
    return 0;
}

int IPv6Module::InitialModule() {
    CloseSocket();
    fd_ = open_icmpv6_socket();
    if (fd_ < 0) {
        VORN_LOG(LOG_ERR, "Failed to open icmpv6 socket");
        return -1;
    }
    return 0;
}

int IPv6Module::StartModule() {
    stopping_ = false;
    if (pipe2(wakeFds_, O_CLOEXEC) != 0 ||
        pthread_create(&thread_, nullptr, &IPv6Module::ListeningThread, this) != 0) {
        VORN_LOG(LOG_ERR, "Failed to create ipv6 polling thread");
        CloseFd(wakeFds_[0]);
        CloseFd(wakeFds_[1]);
        return 0;
    }
    listening_ = true;
    return 0;
}

int IPv6Module::TerminateModule() {
    StopListening();
    CloseSocket();
    return 0;
}

void IPv6Module::StopListening() {
    if (!listening_) {
        return;
    }
    stopping_ = true;
    const char wake = 0;
    while (write(wakeFds_[1], &wake, 1) < 0 && errno == EINTR) {
    }
    pthread_join(thread_, nullptr);
    listening_ = false;
    CloseFd(wakeFds_[0]);
    CloseFd(wakeFds_[1]);
}

void IPv6Module::CloseSocket() {
    CloseFd(fd_);
}

void* IPv6Module::ListeningThread(void* module) {
    static_cast<IPv6Module*>(module)->Listen();
    return nullptr;
}

void IPv6Module::Listen() {
    unsigned char buf[kPacketBytes];
    while (!stopping_) {
        sockaddr_in6 from{};
        in6_pktinfo* info = nullptr;
        const int len = recv_rs_ra(buf, &from, &info);
        if (stopping_) {
            break;
        }
        if (len < 0) {
            VORN_LOG(LOG_ERR, "recv_rs_ra error");
        } else if (len == 0) {
            VORN_LOG(LOG_ERR, "received zero lenght packet");
        } else {
            try {
                HandlePacket(buf, len, from, *info);
            } catch (const std::exception& error) {
                VORN_LOG(LOG_ERR, "Failed to handle router advertisement: %s", error.what());
            }
        }
    }
}

int IPv6Module::open_icmpv6_socket() {
    const int fd = socket(AF_INET6, SOCK_RAW | SOCK_CLOEXEC, IPPROTO_ICMPV6);
    if (fd < 0) {
        VORN_LOG(LOG_ERR, "Failed to create socket(AF_INET6)");
        return -1;
    }
    icmp6_filter filter;
    ICMP6_FILTER_SETBLOCKALL(&filter);
    ICMP6_FILTER_SETPASS(ND_ROUTER_SOLICIT, &filter);
    ICMP6_FILTER_SETPASS(ND_ROUTER_ADVERT, &filter);
    bool ready = SetOption(fd, IPPROTO_IPV6, IPV6_RECVPKTINFO, 1, "IPV6_RECVPKTINFO") &&
                 SetOption(fd, IPPROTO_IPV6, IPV6_UNICAST_HOPS, kHopLimit, "IPV6_UNICAST_HOPS") &&
                 SetOption(fd, IPPROTO_IPV6, IPV6_MULTICAST_HOPS, kHopLimit, "IPV6_MULTICAST_HOPS");
    if (ready && setsockopt(fd, IPPROTO_ICMPV6, ICMP6_FILTER, &filter, sizeof(filter)) < 0) {
        VORN_LOG(LOG_ERR, "Failed to setsockopt(ICMP6_FILTER)");
        ready = false;
    }
    if (!ready) {
        close(fd);
        return -1;
    }
    return fd;
}

// poll rather than select: it has no bound on descriptor numbers, and it also watches the pipe
// that wakes the thread to stop.
int IPv6Module::recv_rs_ra(unsigned char* buf, sockaddr_in6* from, in6_pktinfo** info) {
    if (control_ == nullptr) {
        control_.reset(new (std::nothrow) unsigned char[kControlBytes]);
        if (control_ == nullptr) {
            VORN_LOG(LOG_ERR, "Failed to malloc chdr");
            return -1;
        }
    }
    pollfd waits[2] = {{fd_, POLLIN, 0}, {wakeFds_[0], POLLIN, 0}};
    int ready = 0;
    do {
        ready = poll(waits, 2, -1);
    } while (ready < 0 && errno == EINTR);
    if (ready < 0) {
        VORN_LOG(LOG_ERR, "Failed to select socket");
        return -1;
    }
    if (waits[1].revents != 0) {
        return -1;
    }
    iovec vector{buf, kPacketBytes};
    msghdr message{};
    message.msg_name = from;
    message.msg_namelen = sizeof(*from);
    message.msg_iov = &vector;
    message.msg_iovlen = 1;
    message.msg_control = control_.get();
    message.msg_controllen = kControlBytes;
    const ssize_t len = recvmsg(fd_, &message, 0);
    if (len < 0) {
        VORN_LOG(LOG_ERR, "Failed to receive message");
        return -1;
    }
    *info = FindPacketInfo(message);
    return *info != nullptr ? static_cast<int>(len) : -1;
}

in6_pktinfo* IPv6Module::FindPacketInfo(msghdr& message) {
    const auto* control = static_cast<const unsigned char*>(message.msg_control);
    for (cmsghdr* header = CMSG_FIRSTHDR(&message); header != nullptr;
         header = CMSG_NXTHDR(&message, header)) {
        if (header->cmsg_level != IPPROTO_IPV6 || header->cmsg_type != IPV6_PKTINFO) {
            continue;
        }
        // Read only when the kernel wrote the whole record.
        const std::size_t end =
            static_cast<std::size_t>(CMSG_DATA(header) - control) + sizeof(in6_pktinfo);
        const bool whole =
            header->cmsg_len == CMSG_LEN(sizeof(in6_pktinfo)) && end <= message.msg_controllen;
        in6_pktinfo info{};
        if (whole) {
            std::memcpy(&info, CMSG_DATA(header), sizeof(info));
        }
        if (!whole || info.ipi6_ifindex == 0) {
            VORN_LOG(LOG_ERR, "received a bogus IPV6_PKTINFO from the kernel! len=%d, index=%u\n",
                     static_cast<int>(header->cmsg_len), info.ipi6_ifindex);
            return nullptr;
        }
        return reinterpret_cast<in6_pktinfo*>(CMSG_DATA(header));
    }
    VORN_LOG(LOG_ERR, "received no IPV6_PKTINFO from the kernel");
    return nullptr;
}

void IPv6Module::HandlePacket(const unsigned char* buf, int len, const sockaddr_in6& from,
                              const in6_pktinfo& info) {
    if (len < static_cast<int>(sizeof(icmp6_hdr))) {
        VORN_LOG(LOG_WARNING, "received icmpv6 packet with invalid length: %d", len);
        return;
    }
    const int type = buf[0];
    if (type != ND_ROUTER_SOLICIT && type != ND_ROUTER_ADVERT) {
        VORN_LOG(LOG_ERR, "icmpv6 filter failed");
        return;
    }
    if (type == ND_ROUTER_SOLICIT) {
        return;
    }
    if (len < kRouterAdvertHeaderBytes) {
        VORN_LOG(LOG_WARNING, "received router advertisement with invalid length: %d", len);
        return;
    }
    char gateway[INET6_ADDRSTRLEN];
    print_addr(&from.sin6_addr, gateway);
    // Routers advertise from their link-local address (RFC 4861 6.1.2).
    if (!IN6_IS_ADDR_LINKLOCAL(&from.sin6_addr) || buf[1] != 0) {
        VORN_LOG(LOG_WARNING, "Invalid router advertisement from %s (code %d)", gateway, buf[1]);
        return;
    }
    char prefix[INET6_ADDRSTRLEN] = "";
    if (print_prefix(buf, len, prefix) != 0) {
        return;
    }
    char ifname[IF_NAMESIZE] = "";
    if (if_indextoname(info.ipi6_ifindex, ifname) == nullptr ||
        !vornwireless::utils::IsValidInterfaceName(ifname)) {
        VORN_LOG(LOG_WARNING, "Failed to get interface name of index %u", info.ipi6_ifindex);
        return;
    }
    const std::uint8_t flags = buf[5];
    ProcessRA(gateway, prefix, ifname, (flags & kManagedFlag) != 0, (flags & kOtherFlag) != 0);
    ++advertisements_;
}

void IPv6Module::print_addr(const in6_addr* addr, char* text) {
    if (inet_ntop(AF_INET6, addr, text, INET6_ADDRSTRLEN) == nullptr) {
        VORN_LOG(LOG_ERR, "print_addr: failed to inet_ntop");
        std::strcpy(text, "[invalid address]");
    }
}

int IPv6Module::print_prefix(const unsigned char* msg, int len, char* prefix) {
    for (int offset = kRouterAdvertHeaderBytes; offset < len;) {
        const int left = len - offset;
        if (left < 2) {
            VORN_LOG(LOG_WARNING, "truncated option in RA (len %d)", left);
            return -1;
        }
        const int type = msg[offset];
        const int optlen = msg[offset + 1] * kOptionUnitBytes;
        if (optlen == 0) {
            VORN_LOG(LOG_ERR, "zero length option in RA");
            return -1;
        }
        if (optlen > left) {
            VORN_LOG(LOG_ERR,
                     "option length greater than total length in RA (type %d, optlen %d, len %d)",
                     type, optlen, left);
            return -1;
        }
        if (type == ND_OPT_PREFIX_INFORMATION) {
            if (optlen < static_cast<int>(sizeof(nd_opt_prefix_info))) {
                VORN_LOG(LOG_WARNING, "prefix option too short in RA (optlen %d)", optlen);
                return -1;
            }
            in6_addr address;
            std::memcpy(&address, msg + offset + offsetof(nd_opt_prefix_info, nd_opt_pi_prefix),
                        sizeof(address));
            print_addr(&address, prefix);
        }
        offset += optlen;
    }
    return 0;
}

void IPv6Module::ProcessRA(const std::string& gateway, const std::string& prefix,
                           const std::string& ifname, bool managed, bool other) {
    VORN_NET_IPV6_CONFIG config;
    if (VORNNetIPv6ConfGet(ifname.c_str(), &config) != 0) {
        VORN_LOG(LOG_ERR, "Fail to get ipv6 config(%s)", ifname.c_str());
        return;
    }
    char ipv6Router[kKeyValueBytes] = "";
    const std::string ifcfg = kIfcfgPrefix + ifname;
    if (QLIBCFileGetKeyValue(ifcfg.c_str(), "IPV6ROUTER", ipv6Router, sizeof(ipv6Router), 0) < 0) {
        VORN_LOG(LOG_ERR, "Failed to get key [%s]", "IPV6ROUTER");
        return;
    }
    if (IgnoresAdvertisements(config, ipv6Router, ifname)) {
        SetContext(ifname, InterfaceContext());
        return;
    }
    const int state = TargetState(managed, other);
    if (!ChangeState(ifname, prefix, state)) {
        return;
    }
    RegisterGateway(gateway, ifname);
    if (VORNNetIPv6ConfSet(ConfigurationMode(state), ifname.c_str(), 0, 0, 0) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set ipv6 config(%s)", ifname.c_str());
    }
}

bool IPv6Module::ChangeState(const std::string& ifname, const std::string& prefix, int state) {
    std::lock_guard<std::mutex> lock(contextsMutex_);
    InterfaceContext& context = contexts_[ifname];
    if (context.prefix != prefix) {
        context = InterfaceContext{prefix, InterfaceContext::STATE_NONE};
    }
    if (context.state == state) {
        return false;
    }
    context.state = state;
    return true;
}

void IPv6Module::SetContext(const std::string& ifname, const InterfaceContext& context) {
    std::lock_guard<std::mutex> lock(contextsMutex_);
    contexts_[ifname] = context;
}

IPv6Module::Contexts IPv6Module::GetContexts() const {
    std::lock_guard<std::mutex> lock(contextsMutex_);
    return contexts_;
}

void IPv6Module::RegisterGateway(const std::string& gateway, const std::string& ifname) {
    Json::Value request(Json::objectValue);
    request["type"] = "GTYPE_V6";
    request["priority"] = -2;
    request["ifname"] = ifname;
    request["gateway"] = gateway;
    request["dns"] = "NULL";
    request["refresh"] = true;
    request["method"] = "ADD_GATEWAY_DATA";
    ModuleManager* manager = ModuleManager::GetInstance();
    if (manager == nullptr) {
        VORN_LOG(LOG_ERR, "failed to get network manager");
        return;
    }
    Json::Value answer;
    if (manager->ProcessRequest(MODULE_ROUTE, request, answer) != 0) {
        VORN_LOG(LOG_ERR, "Failed to add gateway data ifname=%s, gateway=%s", ifname.c_str(),
                 gateway.c_str());
    }
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
