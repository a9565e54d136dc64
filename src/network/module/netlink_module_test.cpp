#include "network/module/netlink_module.h"

#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <linux/rtnetlink.h>
#include <net/if.h>

#include <cerrno>
#include <cstring>
#include <vector>

#include "support/sim_root.h"

namespace vornnetwork::network::module {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr unsigned int kUp = IFF_UP;

// rtnetlink messages laid out as the kernel does; AttrLength forges malformed ones.
class Messages {
  public:
    template <typename Fixed>
    Messages& Add(std::uint16_t type, const Fixed& fixed) {
        start_ = bytes_.size();
        nlmsghdr header{};
        header.nlmsg_type = type;
        Append(&header, sizeof(header));
        Append(&fixed, sizeof(fixed));
        return *this;
    }
    Messages& Attr(std::uint16_t type, const void* data, std::size_t size) {
        attribute_ = bytes_.size();
        rtattr header{};
        header.rta_type = type;
        header.rta_len = static_cast<std::uint16_t>(RTA_LENGTH(size));
        Append(&header, sizeof(header));
        Append(data, size);
        return *this;
    }
    Messages& Text(std::uint16_t type, const std::string& text) {
        return Attr(type, text.c_str(), text.size() + 1);
    }
    Messages& Address(std::uint16_t type, int family, const char* text) {
        unsigned char bytes[16] = {};
        EXPECT_EQ(inet_pton(family, text, bytes), 1) << text;
        return Attr(type, bytes, family == AF_INET ? 4 : 16);
    }
    Messages& U32(std::uint16_t type, std::uint32_t value) { return Attr(type, &value, 4); }
    Messages& AttrLength(std::uint16_t length) {
        std::memcpy(&bytes_[attribute_], &length, sizeof(length));
        return *this;
    }
    // Hands the messages to the module as one read of the given size (default: all of it).
    void To(NetlinkModule& module, std::size_t size = 0) {
        std::vector<std::uint32_t> aligned(bytes_.size() / 4 + 1);
        std::memcpy(aligned.data(), bytes_.data(), bytes_.size());
        module.DispatchMessages(aligned.data(), size != 0 ? size : bytes_.size());
    }

  private:
    void Append(const void* data, std::size_t size) {
        const unsigned char* begin = static_cast<const unsigned char*>(data);
        bytes_.insert(bytes_.end(), begin, begin + size);
        bytes_.resize(NLMSG_ALIGN(bytes_.size()), 0);
        const std::uint32_t length = static_cast<std::uint32_t>(bytes_.size() - start_);
        std::memcpy(&bytes_[start_], &length, sizeof(length));
    }

    std::vector<unsigned char> bytes_;
    std::size_t start_ = 0;
    std::size_t attribute_ = 0;
};

Messages& Link(Messages& messages, const std::string& name, unsigned int flags) {
    ifinfomsg info{};
    info.ifi_flags = flags;
    return messages.Add(RTM_NEWLINK, info).Text(IFLA_IFNAME, name);
}

// IPv6 notices carry no label: the name comes from the index, 1 being lo everywhere.
Messages& Addr(Messages& messages, std::uint16_t type, int family, const char* address,
               const std::string& label = "", std::uint32_t index = 1) {
    ifaddrmsg info{};
    info.ifa_family = static_cast<unsigned char>(family);
    info.ifa_prefixlen = family == AF_INET ? 24 : 64;
    info.ifa_index = index;
    messages.Add(type, info).Address(IFA_ADDRESS, family, address);
    if (family == AF_INET) {
        messages.Address(IFA_LOCAL, AF_INET, address).Text(IFA_LABEL, label);
    }
    return messages;
}

const char kEth0Addresses[] =
    "print 2: eth0    inet 10.0.0.2/24 brd 10.0.0.255 scope global eth0\\       valid_lft "
    "forever preferred_lft forever\n"
    "print 2: eth0    inet 10.0.0.4/24 brd 10.0.0.255 scope global secondary eth0\\       "
    "valid_lft forever preferred_lft forever\n";

class NetlinkModuleTest : public vorn::test::RootTest {
  protected:
    NetlinkModuleTest() : module_([this] { return now_; }) {
        for (const char* point : {"ipv4_change", "ipv6_change"}) {
            root_.RecordHook(point, "$IFNAME|$ORIGIN_ADDRESS|$NEW_ADDRESS|$PREFIX_LENGTH");
        }
        root_.Scenario("ip", std::string("when -4 -o addr show dev eth0\n") + kEth0Addresses +
                                 "when -4 -o addr show\n" + kEth0Addresses);
    }

    std::vector<std::string> Handlers() const {
        std::vector<std::string> calls;
        for (const std::string& call : root_.Calls()) {
            if (call.rfind("/etc/rc.network ", 0) == 0) {
                calls.push_back(call.substr(16));
            }
        }
        return calls;
    }
    void Reseed() {
        module_.OnReadFailure(ENOBUFS);
        module_.ReseedIfDue();
    }

    NetlinkModule::Clock::time_point now_{};
    NetlinkModule module_;
};

TEST_F(NetlinkModuleTest, MalformedMessagesAreSkippedWithoutReadingPastThem) {
    Messages framed;
    Link(framed, "eth8", kUp).AttrLength(200);  // attribute past the end
    Addr(framed, RTM_NEWADDR, AF_INET, "10.8.0.1", "eth8").AttrLength(RTA_LENGTH(3));  // cut label
    ifaddrmsg info{};
    info.ifa_family = AF_INET;
    framed.Add(RTM_NEWADDR, info).Attr(IFA_LOCAL, "\x0a\x08", 2).Text(IFA_LABEL, "eth8");
    Addr(framed, RTM_NEWADDR, AF_INET, "10.8.0.2", "eth8;reboot");
    framed.Add(RTM_NEWLINK, info);  // shorter than a link header
    Link(framed, "eth9", kUp).U32(200, 1).U32(0x8000 | IFLA_IFNAME, 1);  // unknown types
    // Well-formed but ignored: lower layer down, an unknown index, an address never seen added.
    Link(framed, "eth0", IFF_UP | IFF_RUNNING);
    Addr(framed, RTM_NEWADDR, AF_INET6, "fd00::4", "", 0x7FFFFFF0);
    Addr(framed, RTM_DELADDR, AF_INET, "10.9.9.9", "eth0");
    framed.To(module_);
    Messages cut;
    Link(cut, "eth10", kUp).To(module_, 40);  // nlmsg_len past the read
    // Only eth9 acted.
    EXPECT_THAT(Handlers(), ElementsAre("route-table-down eth9", "link-down eth9"));
    EXPECT_THAT(root_.HookRuns("ipv4_change"), IsEmpty());
    EXPECT_EQ(log_.Matching("Skipped netlink message").size(), 5u);
    EXPECT_EQ(log_.Matching("bytes of malformed netlink data").size(), 1u);
    EXPECT_EQ(log_.Matching("netlink_module.cpp:").size(), 5u + 1u);
}

TEST_F(NetlinkModuleTest, OverrunsReseedAtMostOnceASecond) {
    root_.WriteFile("/proc/net/if_inet6",
                    "fd000000000000000000000000000005 02 40 00 80     eth0\n"
                    "fe800000000000000000000000000001 03 40 20 80    wlan0\n");
    module_.OnReadFailure(EAGAIN);
    module_.ReseedIfDue();
    EXPECT_THAT(root_.Calls(), IsEmpty());
    Reseed();
    EXPECT_TRUE(log_.Contains("Netlink events lost (receive buffer overrun)"));
    NetlinkState state = module_.Snapshot();
    EXPECT_THAT(state.ipv6.at("eth0"), ElementsAre("fd00::5"));
    EXPECT_THAT(state.ipv6.at("wlan0"), ElementsAre("fe80::1"));

    now_ += std::chrono::milliseconds(400);
    Reseed();
    now_ += std::chrono::milliseconds(599);
    module_.ReseedIfDue();
    EXPECT_EQ(module_.Snapshot().reseeds, 1u);
    // A dump that changed while it was read is taken again a second later.
    root_.Scenario("ip", std::string("when -4 -o addr show\n") + kEth0Addresses +
                             "stderr Dump was interrupted and may be inconsistent.\n");
    now_ += std::chrono::milliseconds(1);
    module_.ReseedIfDue();
    EXPECT_TRUE(module_.Snapshot().reseedPending);
    root_.Scenario("ip", "");
    now_ += std::chrono::seconds(1);
    module_.ReseedIfDue();
    state = module_.Snapshot();
    EXPECT_FALSE(state.reseedPending);
    EXPECT_EQ(state.reseeds, 3u);
    EXPECT_EQ(state.overruns, 2u);
}

TEST_F(NetlinkModuleTest, RequestDHCPIPReappliesOnlyWiredDHCPInterfaces) {
    root_.WriteFile("/etc/sysconfig/network-scripts/ifcfg-eth1", "DEVICE=eth1\nBOOTPROTO=static\n");
    root_.WriteFile("/etc/sysconfig/network-scripts/ifcfg-eth2", "DEVICE=eth2\nBOOTPROTO=dhcp\n");
    root_.WriteFile("/sys/class/net/eth2/brport/state", "3\n");
    EXPECT_EQ(module_.RequestDHCPIP("wlan0"), 0);
    EXPECT_EQ(module_.RequestDHCPIP("eth1"), -1);
    EXPECT_EQ(module_.RequestDHCPIP("eth2"), -1);
    EXPECT_EQ(module_.RequestDHCPIP("eth0"), 0);
    EXPECT_THAT(root_.Calls(), ElementsAre("/etc/rc.network restart-if eth0"));
}

}  // namespace
}  // namespace vornnetwork::network::module
