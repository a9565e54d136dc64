#include "network/module/netlink_module.h"

#include <arpa/inet.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <exception>
#include <iterator>
#include <memory>
#include <new>
#include <sstream>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/asan_interface.h>
#endif

#include "hook/base_hook.h"
#include "platform/qlib_net.h"
#include "platform/qlib_plugin.h"
#include "platform/qlibc_error.h"
#include "platform/root_path.h"
#include "platform/vorn_net.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/net_link_flag.h"
#include "utils/rtattr.h"
#include "utils/sdk_s.h"
#include "utils/string_container.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using vornwireless::utils::IsValidInterfaceName;

// Link, IPv4 address, IPv4 route and IPv6 address notifications.
constexpr std::uint32_t kMulticastGroups = 0x151;
constexpr std::size_t kReadBufferBytes = 4096;
// The default buffer (about 208 KiB) overflows within milliseconds once a burst of address
// changes arrives faster than the hooks they trigger can run.
constexpr int kReceiveBufferBytes = 4 * 1024 * 1024;
// More reads than a full receive buffer can hold: a drain always ends.
constexpr int kMaxDrainReads = 1 << 16;
constexpr int kIdleWaitMilliseconds = 6000;
constexpr auto kReseedInterval = std::chrono::seconds(1);
// What the hooks get for an interface without an IPv4 address.
constexpr const char* kNoAddress = "none";
constexpr int kMaxInterfaces = 32;
constexpr std::size_t kMaxSeedLines = 1 << 16;
constexpr std::size_t kMaxSeedLineBytes = 1024;
// <linux/if.h> would clash with <net/if.h>.
constexpr unsigned int kIffLowerUp = 0x10000;
// Its standard error too: a dump that changes under it says so there, and still exits with 0.
constexpr const char* kIPv4AddressCommand = "/sbin/ip -4 -o addr show 2>&1";
constexpr const char* kInterruptedDump = "Dump was interrupted";
constexpr const char* kIPv6AddressFile = "/proc/net/if_inet6";

// Runs one step of the polling thread with cancellation held off, so that a cancel never strikes
// in the middle of handling; nothing it throws ends the thread.
template <typename Step>
void RunUncancellable(Step step) {
    int previous = PTHREAD_CANCEL_ENABLE;
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &previous);
    try {
        step();
    } catch (const std::exception& error) {
        VORN_LOG(LOG_ERR, "Failed to handle netlink messages: %s", error.what());
    }
    pthread_setcancelstate(previous, nullptr);
}

// Cancellation unwinds the polling thread's stack behind AddressSanitizer's back, leaving the
// redzones of its frames poisoned for the thread's exit code to trip over. Destroyed as the
// unwinding passes, this clears them; it does nothing in other builds.
class CancellationUnwindNotice {
  public:
    CancellationUnwindNotice() = default;
    CancellationUnwindNotice(const CancellationUnwindNotice&) = delete;
    CancellationUnwindNotice& operator=(const CancellationUnwindNotice&) = delete;
    ~CancellationUnwindNotice() {
#if defined(__SANITIZE_ADDRESS__)
        __asan_handle_no_return();
#endif
    }
};

void EnlargeReceiveBuffer(int fd) {
    const int bytes = kReceiveBufferBytes;
    if (setsockopt(fd, SOL_SOCKET, SO_RCVBUFFORCE, &bytes, sizeof(bytes)) == 0) {
        return;
    }
    // Without CAP_NET_ADMIN the kernel caps this at net.core.rmem_max.
    if (setsockopt(fd, SOL_SOCKET, SO_RCVBUF, &bytes, sizeof(bytes)) != 0) {
        VORN_LOG(LOG_WARNING, "Failed to enlarge the netlink receive buffer with err=[%d][%s]",
                 errno, std::strerror(errno));
    }
}

// The fixed part that follows the header, or null when the message is too short to hold it.
template <typename Fixed>
const Fixed* FixedPart(const nlmsghdr* msg) {
    if (msg->nlmsg_len < NLMSG_LENGTH(sizeof(Fixed))) {
        return nullptr;
    }
    return reinterpret_cast<const Fixed*>(reinterpret_cast<const unsigned char*>(msg) +
                                          NLMSG_HDRLEN);
}

// Indexes the attributes after a fixed part of the given size; the fixed part must be present.
int ParseAttributes(const nlmsghdr* msg, std::size_t fixed, const rtattr* table[], int max) {
    const std::size_t offset = NLMSG_HDRLEN + NLMSG_ALIGN(fixed);
    const int length = msg->nlmsg_len > offset ? static_cast<int>(msg->nlmsg_len - offset) : 0;
    const rtattr* first =
        reinterpret_cast<const rtattr*>(reinterpret_cast<const unsigned char*>(msg) + offset);
    return vornwireless::utils::parse_rtattr(table, max, length > 0 ? first : nullptr, length);
}

const unsigned char* Payload(const rtattr* attribute) {
    return reinterpret_cast<const unsigned char*>(attribute) + RTA_LENGTH(0);
}

std::size_t PayloadSize(const rtattr* attribute) {
    return attribute->rta_len - RTA_LENGTH(0);
}

// A string attribute: false unless it ends within its payload.
bool ReadString(const rtattr* attribute, std::string* text) {
    const char* data = reinterpret_cast<const char*>(Payload(attribute));
    const std::size_t size = strnlen(data, PayloadSize(attribute));
    if (size == PayloadSize(attribute)) {
        return false;
    }
    text->assign(data, size);
    return true;
}

bool ReadU32(const rtattr* attribute, std::uint32_t* value) {
    if (PayloadSize(attribute) < sizeof(*value)) {
        return false;
    }
    std::memcpy(value, Payload(attribute), sizeof(*value));
    return true;
}

bool ReadAddress(const rtattr* attribute, int family, std::string* text) {
    const std::size_t needed = family == AF_INET ? sizeof(in_addr) : sizeof(in6_addr);
    char buffer[INET6_ADDRSTRLEN] = {};
    if (PayloadSize(attribute) < needed ||
        inet_ntop(family, Payload(attribute), buffer, sizeof(buffer)) == nullptr) {
        return false;
    }
    *text = buffer;
    return true;
}

// "" when the kernel no longer knows the index (the interface is gone).
std::string IndexToName(std::uint32_t index) {
    char name[IF_NAMESIZE] = {};
    return if_indextoname(index, name) != nullptr ? name : "";
}

// Calls handle with every line of file (line end removed); lines longer than the bound are
// skipped whole, and reading stops after a bounded number of lines.
template <typename Handle>
void ForEachLine(FILE* file, Handle handle) {
    char buffer[kMaxSeedLineBytes];
    std::size_t lines = 0;
    bool skipping = false;
    while (lines < kMaxSeedLines && std::fgets(buffer, sizeof(buffer), file) != nullptr) {
        const std::size_t size = std::strlen(buffer);
        const bool ended = size > 0 && buffer[size - 1] == '\n';
        const bool overlong = !ended && size + 1 == sizeof(buffer);
        if (!skipping && !overlong) {
            handle(std::string(buffer, ended ? size - 1 : size));
            ++lines;
        }
        skipping = !ended && (skipping || overlong);
    }
}

// "2: eth0    inet 10.0.0.2/24 brd 10.0.0.255 scope global eth0:1\       valid_lft ...": the
// label (last word before the backslash, the name IPv4 notifications carry) and the address.
bool ParseIPv4AddressLine(const std::string& line, std::string* label, std::string* address) {
    std::istringstream text(line.substr(0, line.find('\\')));
    const std::vector<std::string> words{std::istream_iterator<std::string>(text),
                                         std::istream_iterator<std::string>()};
    if (words.size() < 5 || words[2] != "inet") {
        return false;
    }
    *address = words[3].substr(0, words[3].find('/'));
    *label = words.back();
    in_addr parsed{};
    return inet_pton(AF_INET, address->c_str(), &parsed) == 1 && IsValidInterfaceName(*label);
}

int HexDigit(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    return c >= 'A' && c <= 'F' ? c - 'A' + 10 : -1;
}

// "fe800000000000000000000000000001 02 40 20 80     eth0": the interface and the address.
bool ParseIPv6AddressLine(const std::string& line, std::string* name, std::string* address) {
    std::istringstream text(line);
    std::string hex;
    std::string index;
    std::string prefix;
    std::string scope;
    std::string flags;
    if (!(text >> hex >> index >> prefix >> scope >> flags >> *name) ||
        hex.size() != 2 * sizeof(in6_addr) || !IsValidInterfaceName(*name)) {
        return false;
    }
    in6_addr bytes{};
    for (std::size_t i = 0; i < sizeof(bytes.s6_addr); ++i) {
        const int high = HexDigit(hex[2 * i]);
        const int low = HexDigit(hex[2 * i + 1]);
        if (high < 0 || low < 0) {
            return false;
        }
        bytes.s6_addr[i] = static_cast<unsigned char>(high * 16 + low);
    }
    char buffer[INET6_ADDRSTRLEN] = {};
    if (inet_ntop(AF_INET6, &bytes, buffer, sizeof(buffer)) == nullptr) {
        return false;
    }
    *address = buffer;
    return true;
}

}  // namespace

NetlinkModule::NetlinkModule(std::function<Clock::time_point()> now)
    : BaseModule(MODULE_NETLINK), ipv4_(kNoAddress), link_(false), now_(std::move(now)) {}

NetlinkModule::~NetlinkModule() {
    if (polling_) {
        TerminateModule();
    } else if (fd_ != -1) {
        close(fd_);
    }
}

BaseModule* NetlinkModule::Create() {
    return new (std::nothrow) NetlinkModule();
}

int NetlinkModule::InitialModule() {
    fd_ = socket(AF_NETLINK, SOCK_DGRAM | SOCK_CLOEXEC, NETLINK_ROUTE);
    if (fd_ < 0) {
        VORN_LOG(LOG_ERR, "NetlinkFd::Init socket(AF_NETLINK) fail.\n");
        return -1;
    }
    const int on = 1;
    if (setsockopt(fd_, SOL_SOCKET, SO_REUSEADDR, &on, sizeof(on)) != 0) {
        VORN_LOG(LOG_ERR, "Failed to setsockopt[SO_REUSEADDR] with err=[%d][%s]", errno,
                 std::strerror(errno));
        return -1;
    }
    EnlargeReceiveBuffer(fd_);
    sockaddr_nl address{};
    address.nl_family = AF_NETLINK;
    address.nl_pid = 0;
    address.nl_groups = kMulticastGroups;
    if (bind(fd_, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0) {
        VORN_LOG(LOG_ERR, "NetlinkFd::Init bind fail with err=[%d][%s]", errno,
                 std::strerror(errno));
        return -1;
    }
    return 0;
}

void* NetlinkModule::PollingThread(void* module) {
    static_cast<NetlinkModule*>(module)->StartPolling();
    pthread_exit(nullptr);
}

int NetlinkModule::StartModule() {
    if (pthread_create(&thread_, nullptr, &NetlinkModule::PollingThread, this) != 0) {
        // The module still counts as started.
        VORN_LOG(LOG_ERR, "Failed to create netlink polling thread");
        return 0;
    }
    polling_ = true;
    return 0;
}

int NetlinkModule::TerminateModule() {
    if (!polling_ || pthread_cancel(thread_) != 0) {
        VORN_LOG(LOG_ERR, "Failed to cancel netlink thread");
    } else {
        void* result = nullptr;
        if (pthread_join(thread_, &result) != 0 || result != PTHREAD_CANCELED) {
            VORN_LOG(LOG_ERR, "netlink thread is not cancelled");
        }
    }
    polling_ = false;
    if (fd_ != -1) {
        close(fd_);
        fd_ = -1;
    }
    return 0;
}

void NetlinkModule::StartPolling() {
    if (fd_ < 0) {
        VORN_LOG(LOG_ERR, "Bad RTNETLINK fd [%d]", fd_);
        return;
    }
    RunUncancellable([this] {
        InitInterface();
        SeedIPv4Addresses();
    });
    const CancellationUnwindNotice notice;
    for (;;) {
        pollfd watched{fd_, POLLIN, 0};
        // The only point where the thread can be cancelled.
        const int ready = poll(&watched, 1, PollTimeoutMilliseconds());
        RunUncancellable([this, ready] {
            if (ready > 0) {
                AnalysisNetlinkMessage();
            }
            ReseedIfDue();
        });
    }
}

int NetlinkModule::PollTimeoutMilliseconds() const {
    if (!reseedPending_ || !lastReseed_) {
        return kIdleWaitMilliseconds;
    }
    const auto left =
        std::chrono::ceil<std::chrono::milliseconds>(*lastReseed_ + kReseedInterval - now_());
    if (left.count() <= 0) {
        return 0;
    }
    return left.count() < kIdleWaitMilliseconds ? static_cast<int>(left.count())
                                                : kIdleWaitMilliseconds;
}

int NetlinkModule::InitInterface() {
    QLIB_NET_IF_INFO interfaces[kMaxInterfaces];
    std::memset(interfaces, 0, sizeof(interfaces));
    const int count = QLIBNetGetInterfaceInfo(interfaces, kMaxInterfaces,
                                              QLIB_NET_INFO_LINK | QLIB_NET_INFO_IPV4);
    if (count < 0) {
        VORN_LOG(LOG_ERR, "Failed to get net interface, errno=0x%X",
                 static_cast<unsigned int>(QLIBCErrGet()));
        return -1;
    }
    std::lock_guard<std::mutex> lock(stateMutex_);
    for (int i = 0; i < count && i < kMaxInterfaces; ++i) {
        const QLIB_NET_IF_INFO& record = interfaces[i];
        const std::string name(record.name, strnlen(record.name, sizeof(record.name)));
        if (record.link == QLIB_NET_LINK_UP) {
            link_.Set(name, true);
            // The platform gives an empty text for an interface up without an address; hooks
            // are promised "none" for it.
            const std::string ipv4(record.ipv4, strnlen(record.ipv4, sizeof(record.ipv4)));
            ipv4_.Set(name, ipv4.empty() ? kNoAddress : ipv4);
        } else {
            link_.Set(name, false);
        }
    }
    return 0;
}

bool NetlinkModule::SeedIPv4Addresses() {
    FILE* pipe = popen(vorn::platform::RootShellCommand(kIPv4AddressCommand).c_str(), "re");
    if (pipe == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", kIPv4AddressCommand);
        return false;
    }
    std::map<std::string, std::set<std::string>> present;
    bool interrupted = false;
    ForEachLine(pipe, [&present, &interrupted](const std::string& line) {
        std::string label;
        std::string address;
        if (ParseIPv4AddressLine(line, &label, &address)) {
            present[label].insert(address);
        }
        interrupted = interrupted || line.find(kInterruptedDump) != std::string::npos;
    });
    if (pclose(pipe) != 0) {
        VORN_LOG(LOG_ERR, "Failed to execute cmd [%s]", kIPv4AddressCommand);
        return false;
    }
    if (interrupted) {
        VORN_LOG(LOG_WARNING, "The IPv4 addresses changed while they were read");
        return false;
    }
    std::lock_guard<std::mutex> lock(stateMutex_);
    ipv4Present_.swap(present);
    return true;
}

void NetlinkModule::SeedIPv6Addresses() {
    std::map<std::string, std::vector<std::string>> addresses;
    // No file: the kernel has no IPv6, so there are no addresses.
    FILE* file = std::fopen(vorn::platform::RootPath(kIPv6AddressFile).c_str(), "re");
    if (file != nullptr) {
        ForEachLine(file, [&addresses](const std::string& line) {
            std::string name;
            std::string address;
            if (ParseIPv6AddressLine(line, &name, &address)) {
                addresses[name].push_back(address);
            }
        });
        std::fclose(file);
    }
    std::lock_guard<std::mutex> lock(stateMutex_);
    ipv6_.swap(addresses);
}

int NetlinkModule::AnalysisNetlinkMessage() {
    alignas(nlmsghdr) unsigned char buffer[kReadBufferBytes];
    iovec io{buffer, sizeof(buffer)};
    sockaddr_nl sender{};
    msghdr message{};
    message.msg_name = &sender;
    message.msg_namelen = sizeof(sender);
    message.msg_iov = &io;
    message.msg_iovlen = 1;
    const ssize_t length = recvmsg(fd_, &message, MSG_DONTWAIT);
    if (length < 0) {
        OnReadFailure(errno);
        return -1;
    }
    if (length == 0) {
        VORN_LOG(LOG_ERR, "recvmsg ret:%d from fd [%d].", static_cast<int>(length), fd_);
        return -1;
    }
    // Only the kernel speaks on this socket; a local process could unicast forged notices.
    if (sender.nl_pid != 0) {
        return -1;
    }
    DispatchMessages(buffer, static_cast<std::size_t>(length));
    return -1;
}

void NetlinkModule::DispatchMessages(const void* data, std::size_t length) {
    const unsigned char* cursor = static_cast<const unsigned char*>(data);
    std::size_t left = cursor != nullptr ? length : 0;
    while (left >= NLMSG_HDRLEN) {
        const nlmsghdr* msg = reinterpret_cast<const nlmsghdr*>(cursor);
        if (msg->nlmsg_len < NLMSG_HDRLEN || msg->nlmsg_len > left) {
            break;
        }
        {
            std::lock_guard<std::mutex> lock(stateMutex_);
            ++messages_;
        }
        switch (msg->nlmsg_type) {
            case RTM_NEWADDR:
            case RTM_DELADDR:
                CheckIPChangeEvent(msg);
                break;
            case RTM_NEWLINK:
                CheckNewLinkEvent(msg);
                break;
            case RTM_NEWROUTE:
            case RTM_DELROUTE:
                CheckRouteChangeEvent(msg);
                break;
            default:
                break;
        }
        // The last message may come without its padding.
        const std::size_t step = NLMSG_ALIGN(msg->nlmsg_len);
        left = step < left ? left - step : 0;
        cursor += step;
    }
    if (left > 0) {
        VORN_LOG(LOG_WARNING, "Dropped [%u] bytes of malformed netlink data",
                 static_cast<unsigned int>(left));
    }
}

int NetlinkModule::SkipMalformed(const nlmsghdr* msg, const char* why) {
    VORN_LOG(LOG_WARNING, "Skipped netlink message type [%u] length [%u]: %s",
             static_cast<unsigned int>(msg->nlmsg_type), static_cast<unsigned int>(msg->nlmsg_len),
             why);
    return -1;
}

int NetlinkModule::CheckNewLinkEvent(const nlmsghdr* msg) {
    if (msg == nullptr) {
        VORN_LOG(LOG_ERR, "Null pointer");
        return -1;
    }
    if (msg->nlmsg_type != RTM_NEWLINK) {
        VORN_LOG(LOG_ERR, "Not RTM_NEWLINK event");
        return -1;
    }
    const ifinfomsg* info = FixedPart<ifinfomsg>(msg);
    if (info == nullptr) {
        return SkipMalformed(msg, "truncated");
    }
    const unsigned int flags = info->ifi_flags;
    if ((flags & IFF_RUNNING) != 0 && (flags & kIffLowerUp) == 0) {
        return -1;
    }
    const rtattr* table[IFLA_MASTER + 1];
    if (ParseAttributes(msg, sizeof(ifinfomsg), table, IFLA_MASTER) != 0) {
        SkipMalformed(msg, "bad attribute length");
        return 0;
    }
    std::string name;
    if (table[IFLA_IFNAME] == nullptr) {
        return 0;
    }
    if (!ReadString(table[IFLA_IFNAME], &name) || !IsValidInterfaceName(name)) {
        SkipMalformed(msg, "bad interface name");
        return 0;
    }
    // Bridge ports carry no IFF_SLAVE, only their master's index.
    std::uint32_t master = 0;
    const bool slave =
        (flags & IFF_SLAVE) != 0 ||
        (table[IFLA_MASTER] != nullptr && ReadU32(table[IFLA_MASTER], &master) && master != 0);
    return OnInterfaceStatusChange(name, (flags & IFF_RUNNING) != 0, slave);
}

int NetlinkModule::OnInterfaceStatusChange(const std::string& ifname, bool running, bool slave) {
    const bool known = link_.Contains(ifname) && link_[ifname] == running;
    if (!slave && !known) {
        vornwireless::utils::SetNetLinkIsProcessing();
        if (running) {
            vornwireless::sdk_s::NetRoutetableHandler_S(0, ifname.c_str());
            vornwireless::sdk_s::QLIBNetIfLinkUpEvent_S(ifname.c_str());
        } else {
            vornwireless::sdk_s::NetRoutetableHandler_S(1, ifname.c_str());
            vornwireless::sdk_s::QLIBNetIfLinkDownEvent_S(ifname.c_str());
        }
        vornwireless::utils::UnsetNetLinkIsProcessing();
    }
    std::lock_guard<std::mutex> lock(stateMutex_);
    link_.Set(ifname, running);
    return running ? 0 : 1;
}

int NetlinkModule::CheckIPChangeEvent(const nlmsghdr* msg) {
    if (msg == nullptr) {
        VORN_LOG(LOG_ERR, "Null pointer");
        return -1;
    }
    const ifaddrmsg* info = FixedPart<ifaddrmsg>(msg);
    if (info == nullptr) {
        return SkipMalformed(msg, "truncated");
    }
    const rtattr* table[IFA_CACHEINFO + 1];
    if (ParseAttributes(msg, sizeof(ifaddrmsg), table, IFA_CACHEINFO) != 0) {
        return SkipMalformed(msg, "bad attribute length");
    }
    const rtattr* address = table[IFA_LOCAL] != nullptr ? table[IFA_LOCAL] : table[IFA_ADDRESS];
    if (address == nullptr || (info->ifa_family != AF_INET && info->ifa_family != AF_INET6)) {
        return -1;
    }
    std::string addr;
    if (!ReadAddress(address, info->ifa_family, &addr)) {
        return SkipMalformed(msg, "short address");
    }
    std::string name;
    if (table[IFA_LABEL] != nullptr) {
        if (!ReadString(table[IFA_LABEL], &name)) {
            return SkipMalformed(msg, "bad label");
        }
    } else {
        name = IndexToName(info->ifa_index);
        if (name.empty()) {
            return -1;
        }
    }
    if (!IsValidInterfaceName(name)) {
        return SkipMalformed(msg, "bad interface name");
    }
    const bool added = msg->nlmsg_type == RTM_NEWADDR;
    if (info->ifa_family == AF_INET) {
        OnIPv4Event(name, addr, info->ifa_prefixlen, added);
    } else {
        ProcessIPv6Event(name, addr, info->ifa_prefixlen, added);
    }
    return 0;
}

void NetlinkModule::OnIPv4Event(const std::string& ifname, const std::string& addr, int prefixlen,
                                bool added) {
    {
        std::lock_guard<std::mutex> lock(stateMutex_);
        if (added) {
            ipv4Present_[ifname].insert(addr);
        } else {
            // An address never seen added changes nothing when it goes: its notice was lost in an
            // overrun, or the kernel skipped it for an address removed at once.
            const auto found = ipv4Present_.find(ifname);
            if (found == ipv4Present_.end() || found->second.erase(addr) == 0) {
                return;
            }
        }
    }
    ProcessIPv4Event(ifname, addr, prefixlen);
}

void NetlinkModule::ProcessIPv4Event(const std::string& ifname, const std::string& addr,
                                     int prefixlen) {
    const std::string old = ipv4_[ifname];
    if (old == addr) {
        return;
    }
    vornwireless::hook::NetIPChangeEvent(vornwireless::hook::IPTYPE_IPV4, ifname, old, addr,
                                         prefixlen);
    std::lock_guard<std::mutex> lock(stateMutex_);
    ipv4_.Set(ifname, addr);
}

void NetlinkModule::ProcessIPv6Event(const std::string& ifname, const std::string& addr,
                                     int prefixlen, bool added) {
    const auto found = ipv6_.find(ifname);
    std::vector<std::string> addresses =
        found != ipv6_.end() ? found->second : std::vector<std::string>();
    const bool known = vornwireless::utils::IsExist(addr, addresses);
    if (known == added) {
        return;
    }
    if (added) {
        vornwireless::hook::NetIPChangeEvent(vornwireless::hook::IPTYPE_IPV6, ifname,
                                             vornwireless::utils::ConvertToString(addresses, ","),
                                             addr, prefixlen);
        addresses.push_back(addr);
    } else {
        vornwireless::utils::Remove(addr, addresses);
    }
    std::lock_guard<std::mutex> lock(stateMutex_);
    ipv6_[ifname] = addresses;
}

int NetlinkModule::CheckRouteChangeEvent(const nlmsghdr* msg) {
    if (msg == nullptr) {
        VORN_LOG(LOG_ERR, "Null pointer");
        return -1;
    }
    const rtmsg* route = FixedPart<rtmsg>(msg);
    if (route == nullptr) {
        return SkipMalformed(msg, "truncated");
    }
    // Only IPv4 routes are subscribed to; anything else cannot be read as one.
    if (route->rtm_table != RT_TABLE_MAIN || route->rtm_family != AF_INET) {
        return -1;
    }
    const rtattr* table[RTA_GATEWAY + 1];
    if (ParseAttributes(msg, sizeof(rtmsg), table, RTA_GATEWAY) != 0) {
        return SkipMalformed(msg, "bad attribute length");
    }
    std::string ifname;
    std::string destination;
    std::string gateway;
    std::uint32_t index = 0;
    if ((table[RTA_OIF] != nullptr && !ReadU32(table[RTA_OIF], &index)) ||
        (table[RTA_DST] != nullptr && !ReadAddress(table[RTA_DST], AF_INET, &destination)) ||
        (table[RTA_GATEWAY] != nullptr && !ReadAddress(table[RTA_GATEWAY], AF_INET, &gateway))) {
        return SkipMalformed(msg, "short attribute");
    }
    if (table[RTA_OIF] != nullptr) {
        ifname = IndexToName(index);
    }
    const char* action = msg->nlmsg_type == RTM_NEWROUTE ? "NEW" : "DEL";
    std::unique_ptr<vornwireless::hook::GatewayChangeHook> hook(new (
        std::nothrow) vornwireless::hook::GatewayChangeHook(action, ifname, destination, gateway));
    if (hook == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to new GatewayChangeHook");
        return -1;
    }
    hook->ExecHook(QLIB_PLUGIN_ACTION_AFTER);
    return 0;
}

void NetlinkModule::OnReadFailure(int error) {
    if (error != ENOBUFS) {
        return;
    }
    const int dropped = DrainSocket();
    VORN_LOG(LOG_WARNING,
             "Netlink events lost (receive buffer overrun): dropped [%d] queued reads, re-seeding",
             dropped);
    std::lock_guard<std::mutex> lock(stateMutex_);
    ++overruns_;
    reseedPending_ = true;
}

int NetlinkModule::DrainSocket() {
    if (fd_ < 0) {
        return 0;
    }
    alignas(nlmsghdr) unsigned char buffer[kReadBufferBytes];
    int reads = 0;
    for (int attempt = 0; attempt < kMaxDrainReads; ++attempt) {
        if (recv(fd_, buffer, sizeof(buffer), MSG_DONTWAIT) >= 0) {
            ++reads;
        } else if (errno != ENOBUFS) {
            break;
        }
    }
    return reads;
}

void NetlinkModule::ReseedIfDue() {
    const Clock::time_point now = now_();
    if (!reseedPending_ || (lastReseed_ && now - *lastReseed_ < kReseedInterval)) {
        return;
    }
    lastReseed_ = now;
    const bool links = InitInterface() == 0;
    const bool ipv4 = SeedIPv4Addresses();
    SeedIPv6Addresses();
    std::lock_guard<std::mutex> lock(stateMutex_);
    ++reseeds_;
    // An incomplete view is taken again a second later.
    reseedPending_ = !links || !ipv4;
}

NetlinkState NetlinkModule::Snapshot() const {
    std::lock_guard<std::mutex> lock(stateMutex_);
    NetlinkState state;
    state.links = link_.Entries();
    state.ipv4 = ipv4_.Entries();
    state.ipv4Present = ipv4Present_;
    state.ipv6 = ipv6_;
    state.messages = messages_;
    state.overruns = overruns_;
    state.reseeds = reseeds_;
    state.reseedPending = reseedPending_;
    return state;
}

int NetlinkModule::RequestDHCPIP(const std::string& ifname) const {
    // Wireless interfaces are the wifi daemon's.
    if (ifname.compare(0, 4, "wlan") == 0) {
        return 0;
    }
    if (QLIBNetBridgeIfIsSlave(ifname.c_str()) == 1 ||
        vornwireless::sdk_s::BlVORNLnxIsDHCP_S(ifname.c_str()) != 1) {
        return -1;
    }
    VORN_NET_IF_CONFIG record;
    std::memset(&record, 0, sizeof(record));
    if (vornwireless::sdk_s::VORNNetIFGetInfo_S(ifname.c_str(), 0, &record) != 0) {
        VORN_LOG(LOG_ERR, "Get %s net info failed", ifname.c_str());
        return -1;
    }
    if (vornwireless::sdk_s::VORNNetSetCard1_S(&record, 0) != 0) {
        VORN_LOG(LOG_ERR, "VORNNetSetCard1_S failed, vornerr=[0x%04X]",
                 static_cast<unsigned int>(QLIBCErrGet()));
        return -1;
    }
    return 0;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
