#include "network/module/ipv6_module.h"

#include <arpa/inet.h>
#include <gmock/gmock.h>
#include <net/if.h>

#include <cstdint>
#include <string>
#include <vector>

#include "network/module/module_manager.h"
#include "network/module/route_module.h"
#include "platform/vorn_net.h"
#include "support/sim_root.h"

namespace vornnetwork::network::module {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using Bytes = std::vector<unsigned char>;

const std::string kIfcfg = "/etc/sysconfig/network-scripts/ifcfg-";
constexpr char kAutoconf[] = "IPV6INIT=yes\nIPV6_AUTOCONF=yes\n";
constexpr std::uint8_t kManaged = 0x80;
constexpr std::uint8_t kOther = 0x40;

Bytes PrefixOption(const char* prefix, unsigned char units = 4) {
    Bytes option(units * 8u, 0);
    option[0] = 3;
    option[1] = units;
    if (option.size() >= 32) {
        option[2] = 64;
        inet_pton(AF_INET6, prefix, &option[16]);
    }
    return option;
}

// A router advertisement with a source link-layer address option and then the given options.
Bytes Advert(std::uint8_t flags, const std::vector<Bytes>& options) {
    Bytes packet = {134, 0, 0, 0, 64, flags, 0x07, 0x08, 0, 0, 0, 0,
                    0,   0, 0, 0, 1,  1,     2,    0,    0, 0, 0, 1};
    for (const Bytes& option : options) {
        packet.insert(packet.end(), option.begin(), option.end());
    }
    return packet;
}

using vorn::test::Parse;

class IPv6ModuleTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        manager_->RemoveModule(MODULE_ROUTE);
        ASSERT_TRUE(manager_->AddModule({MODULE_ROUTE, true, &RouteModule::Create}));
    }
    void TearDown() override { manager_->RemoveModule(MODULE_ROUTE); }

    // The calls of the programs the module drives, then a fresh call log.
    std::vector<std::string> TakeCalls() {
        std::vector<std::string> calls;
        for (const std::string& call : root_.Calls()) {
            if (call.find("route show") == std::string::npos) {
                calls.push_back(call);
            }
        }
        root_.ClearCalls();
        return calls;
    }
    InterfaceContext Context(const std::string& ifname) const {
        return module_.GetContexts()[ifname];
    }
    int Mode(const char* ifname) {
        VORN_NET_IPV6_CONFIG config;
        EXPECT_EQ(VORNNetIPv6ConfGet(ifname, &config), 0);
        return config.type == VORN_NET_IPV6_TYPE_AUTO ? config.mode : -1;
    }
    void Receive(const Bytes& packet, const char* sender = "fe80::1",
                 unsigned int index = if_nametoindex("lo")) {
        sockaddr_in6 from{};
        from.sin6_family = AF_INET6;
        inet_pton(AF_INET6, sender, &from.sin6_addr);
        in6_pktinfo info{};
        info.ipi6_ifindex = index;
        // An exact-size copy, so that a read past the end trips the address sanitizer.
        const Bytes exact(packet);
        module_.HandlePacket(exact.data(), static_cast<int>(exact.size()), from, info);
    }

    ModuleManager* manager_ = ModuleManager::GetInstance();
    IPv6Module module_;
};

// Once per change against a real router is the system test's; the flags' files and the reset
// are this one's.
TEST_F(IPv6ModuleTest, FlagsChooseTheModeAndAResetForgetsTheInterface) {
    module_.ProcessRA("fe80::1", "2001:db8:1::", "eth0", false, false);
    EXPECT_THAT(TakeCalls(), ElementsAre("/sbin/ip -6 route add default via fe80::1 dev eth0",
                                         "/etc/rc.network ipv6-restart eth0"));
    EXPECT_EQ(Context("eth0").state, InterfaceContext::STATE_AUTOCONF);
    module_.ProcessRA("fe80::1", "2001:db8:1::", "eth0", false, true);
    EXPECT_THAT(root_.ReadFile(kIfcfg + "eth0"), HasSubstr("DHCPV6C=yes\nDHCPV6C_OPTIONS=-S\n"));
    EXPECT_EQ(Mode("eth0"), VORN_NET_IPV6_MODE_OTHER);

    // Other shapes of the request are the daemon test's.
    Json::Value answer;
    EXPECT_EQ(
        module_.ProcessRequest(Parse(R"({"method":"RESET_IPV6_MODULE","ifname":"eth0"})"), answer),
        0);
    EXPECT_EQ(module_.GetContexts().count("eth0"), 0u);
}

TEST_F(IPv6ModuleTest, RoutersAndUnmanagedInterfacesAreNeverApplied) {
    root_.WriteFile(kIfcfg + "lbr0", kAutoconf);
    root_.WriteFile(kIfcfg + "eth1", std::string(kAutoconf) + "IPV6FORWARDING=yes\n");
    root_.WriteFile(kIfcfg + "eth2", "IPV6INIT=yes\nIPV6ADDR=2001:db8::5/64\n");
    root_.WriteFile(kIfcfg + "eth3", std::string(kAutoconf) + "IPV6ROUTER=yes-please\n");
    for (const char* ifname : {"lbr0", "eth1", "eth2", "eth3", "eth9"}) {
        module_.ProcessRA("fe80::1", "2001:db8:1::", ifname, true, false);
        EXPECT_EQ(Context(ifname).state, InterfaceContext::STATE_NONE) << ifname;
    }
    EXPECT_THAT(TakeCalls(), IsEmpty());
    EXPECT_TRUE(log_.Contains("Fail to get ipv6 config(eth9)"));

    // A failed registration still switches the mode.
    manager_->RemoveModule(MODULE_ROUTE);
    root_.WriteFile(kIfcfg + "eth5", kAutoconf);
    module_.ProcessRA("fe80::1", "", "eth5", true, false);
    EXPECT_TRUE(log_.Contains("Failed to add gateway data ifname=eth5, gateway=fe80::1"));
    EXPECT_THAT(TakeCalls(), ElementsAre("/etc/rc.network ipv6-restart eth5"));

    // The platform refuses bad names and modes; a mode switch writes the whole record.
    VORN_NET_IPV6_CONFIG config;
    EXPECT_EQ(VORNNetIPv6ConfGet("../ifcfg-eth1", &config), -1);
    EXPECT_EQ(VORNNetIPv6ConfSet(1, "eth1", 0, 0, 0), -1);
    EXPECT_EQ(VORNNetIPv6ConfSet(VORN_NET_IPV6_MODE_MANAGED, "eth9", 0, 0, 0), -1);
    root_.WriteFile(kIfcfg + "eth6", "IPV6INIT=yes\nDHCPV6C=yes\nDHCPV6C_OPTIONS=\"-v -S\"\n");
    ASSERT_EQ(VORNNetIPv6ConfSet(VORN_NET_IPV6_MODE_AUTOCONF, "eth6", 0, 0, 0), 0);
    EXPECT_EQ(root_.ReadFile(kIfcfg + "eth6"), "IPV6INIT=yes\nDHCPV6C=no\nIPV6_AUTOCONF=yes\n");
}

TEST_F(IPv6ModuleTest, PacketsGiveRouterPrefixAndFlagsAndMalformedOnesAreDroppedWhole) {
    root_.WriteFile(kIfcfg + "lo", kAutoconf);
    Receive(
        Advert(kManaged | kOther, {PrefixOption("2001:db8:7::"), PrefixOption("2001:db8:9::")}));
    EXPECT_EQ(Context("lo").prefix, "2001:db8:9::");
    EXPECT_EQ(Context("lo").state, InterfaceContext::STATE_MANAGED);
    EXPECT_THAT(TakeCalls(), ElementsAre("/sbin/ip -6 route add default via fe80::1 dev lo",
                                         "/etc/rc.network ipv6-restart lo"));
    Receive({133, 0, 0, 0, 0, 0, 0, 0});  // solicitations pass the filter and are left alone
    // Every cut of a good advertisement: only those that end on an option boundary are read.
    const Bytes good = Advert(kOther, {PrefixOption("2001:db8:7::")});
    for (std::size_t len = 0; len <= good.size(); ++len) {
        Receive(Bytes(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(len)));
    }
    EXPECT_EQ(module_.AdvertisementsHandled(), 4u);  // 16, 24 and 56 bytes
    EXPECT_EQ(Context("lo").state, InterfaceContext::STATE_OTHER);
    EXPECT_TRUE(log_.Contains("truncated option in RA (len 1)"));
    EXPECT_TRUE(
        log_.Contains("option length greater than total length in RA (type 3, optlen 32, len 31)"));

    log_.Clear();
    root_.ClearCalls();
    Receive(Advert(kManaged, {PrefixOption("2001:db8:8::"), {25, 0, 0, 0, 0, 0, 0, 0}}));
    Receive(Advert(kManaged, {PrefixOption("", 3)}));
    Receive(Advert(kManaged, {PrefixOption("2001:db8:8::")}), "2001:db8::1");
    Receive(Advert(kManaged, {PrefixOption("2001:db8:8::")}), "fe80::1", 0x7fffffff);
    Bytes coded = Advert(kManaged, {});
    coded[1] = 1;
    Receive(coded);
    Receive({1, 0, 0, 0, 0, 0, 0, 0});
    EXPECT_EQ(module_.AdvertisementsHandled(), 4u);
    EXPECT_THAT(TakeCalls(), IsEmpty());
    EXPECT_EQ(log_.Matching("zero length option in RA").size(), 1u);
    EXPECT_EQ(log_.Matching("prefix option too short in RA").size(), 1u);
    EXPECT_EQ(log_.Matching("Invalid router advertisement from").size(), 2u);
}

}  // namespace
}  // namespace vornnetwork::network::module
