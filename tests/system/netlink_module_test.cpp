#include "network/module/netlink_module.h"

#include <gmock/gmock.h>

#include <algorithm>
#include <fstream>

#include "network/utils.h"
#include "platform/shell_command.h"
#include "support/net_namespace.h"
#include "support/sim_root.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using vorn::test::SimRoot;
using vorn::test::WaitFor;

// The real kernel in a private namespace, the live root's simulated /etc/rc.network recording
// the platform's link handlers, and hook scripts recording their variables.
class NetlinkModuleSystemTest : public ::testing::Test {
  protected:
    void SetUp() override {
        VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
        root_ = std::make_unique<SimRoot>(SimRoot::Kind::kLive);
        for (const char* point : {"ipv4_change", "ipv6_change"}) {
            root_->RecordHook(point, "$IFNAME|$ORIGIN_ADDRESS|$NEW_ADDRESS|$PREFIX_LENGTH");
        }
        root_->RecordHook("gateway_change", "$ACTION|$IFNAME|$DESTINATION|$GATEWAY");
        // No link-local addresses: the IPv6 lists hold only what the tests add.
        std::ofstream(root_->Path("/proc/sys/net/ipv6/conf/default/addr_gen_mode")) << "1\n";
        Ip("link add v0 index 11 type veth peer name v1 index 12");
        Ip("link add m0 index 21 type veth peer name m1 index 22");
        Ip("link add br0 index 31 type bridge");
        Ip("link add p0 index 32 master br0 type veth peer name p1 index 33");
        Ip("link add q0 index 34 master br0 type veth peer name q1 index 35");
        for (const char* name : {"v0", "v1", "m0", "m1", "p0", "p1", "q0", "q1", "br0"}) {
            Ip(std::string("link set ") + name + " up");
        }
        Ip("addr add 192.0.2.254/32 dev m0");
        for (const char* name : {"v0", "m0", "p0", "br0"}) {
            ASSERT_TRUE(WaitFor([&] { return Operstate(name) == "up\n"; })) << name;
        }
        module_ = std::make_unique<NetlinkModule>();
        ASSERT_EQ(module_->Initialize(), 0);
        ASSERT_EQ(module_->Start(), 0);
        // Seeded: the start-up address is known.
        ASSERT_TRUE(WaitFor([&] { return module_->Snapshot().ipv4Present.count("m0") != 0; }));
        Barrier();
        root_->ClearCalls();
    }
    void TearDown() override {
        if (module_ != nullptr) {
            EXPECT_EQ(module_->Terminate(), 0);
        }
    }

    void Ip(const std::string& arguments) const {
        std::string line;
        ASSERT_EQ(vorn::platform::ReadShellCommandLine(
                      "/sbin/ip " + arguments + " 2>&1 && echo done", line),
                  0);
        ASSERT_EQ(line, "done\n") << "ip " << arguments;
    }
    std::string Operstate(const std::string& name) const {
        return root_->ReadFile("/sys/class/net/" + name + "/operstate");
    }
    // The hook's runs whose line contains part.
    std::vector<std::string> Runs(const std::string& point, const std::string& part) const {
        std::vector<std::string> lines = root_->HookRuns(point);
        lines.erase(std::remove_if(lines.begin(), lines.end(),
                                   [&](const std::string& line) {
                                       return line.find(part) == std::string::npos;
                                   }),
                    lines.end());
        return lines;
    }
    // The platform link handler calls naming the interface.
    std::vector<std::string> Handlers(const std::string& name) const {
        std::vector<std::string> calls;
        for (const std::string& call : root_->Calls()) {
            if (call.rfind("/etc/rc.network ", 0) == 0 && call.size() > name.size() + 1 &&
                call.compare(call.size() - name.size() - 1, std::string::npos, " " + name) == 0) {
                calls.push_back(call.substr(16));
            }
        }
        return calls;
    }
    // Notices are handled in order: once the marker's own hook has run, so has everything
    // caused before it.
    void Barrier() {
        const std::string marker = "192.0.2." + std::to_string(++markers_);
        Ip("addr add " + marker + "/32 dev m0");
        ASSERT_TRUE(WaitFor([&] {
            const std::vector<std::string> runs = Runs("ipv4_change", "m0|");
            return std::any_of(runs.begin(), runs.end(), [&](const std::string& run) {
                return run.find("|" + marker + "|32") != std::string::npos;
            });
        })) << marker;
    }

    std::unique_ptr<SimRoot> root_;
    std::unique_ptr<NetlinkModule> module_;
    int markers_ = 0;
};

TEST_F(NetlinkModuleSystemTest, EveryChangeRunsItsHandlersOrHooksOnceAndBridgePortsNone) {
    Ip("link set v1 down");
    ASSERT_TRUE(WaitFor([&] { return Handlers("v0").size() >= 2; }));
    EXPECT_FALSE(IsEthernetLinkDetected("v0"));
    Ip("link set v1 up");
    ASSERT_TRUE(WaitFor([&] { return Operstate("v0") == "up\n"; }));
    EXPECT_TRUE(IsEthernetLinkDetected("v0"));
    Ip("link set p1 down");
    Ip("link set p1 up");
    ASSERT_TRUE(WaitFor([&] { return Operstate("p0") == "up\n"; }));
    Barrier();

    for (const std::string name : {"v0", "v1", "p1"}) {
        EXPECT_THAT(Handlers(name), ElementsAre("route-table-down " + name, "link-down " + name,
                                                "route-table-up " + name, "link-up " + name));
    }
    // The bridge port's carrier went and came back; the bridge kept running on q0.
    EXPECT_THAT(Handlers("p0"), IsEmpty());
    EXPECT_THAT(Handlers("br0"), IsEmpty());
    EXPECT_TRUE(module_->Snapshot().links.at("p0"));

    // Addresses and routes run the hooks once per change, and no link handler.
    root_->ClearCalls();
    Ip("addr add 10.11.0.1/24 dev v0");
    Ip("addr add 10.11.0.2/24 dev v0");
    Ip("route add 10.99.0.0/16 via 10.11.0.254 dev v0");
    Ip("route add 10.98.0.0/16 via 10.11.0.254 dev v0 table 100");
    Ip("route del 10.99.0.0/16 via 10.11.0.254 dev v0");
    Ip("addr del 10.11.0.2/24 dev v0");  // the last one seen: no change
    Ip("addr del 10.11.0.1/24 dev v0");  // an earlier one: taken as a change to it
    Ip("-6 addr add fd11::1/64 dev v0");
    Ip("-6 addr add fd11::2/64 dev v0");
    // Duplicate detection ends with a second notice of each address.
    ASSERT_TRUE(WaitFor([&] {
        std::string line;
        return vorn::platform::ReadShellCommandLine("/sbin/ip -6 -o addr show dev v0 tentative",
                                                    line) == 0 &&
               line.empty();
    }));
    Ip("-6 addr del fd11::1/64 dev v0");
    Ip("-6 addr add fd11::3/64 dev v0 nodad");
    Barrier();

    EXPECT_THAT(Runs("ipv4_change", "v0|"),
                ElementsAre("v0|none|10.11.0.1|24", "v0|10.11.0.1|10.11.0.2|24",
                            "v0|10.11.0.2|10.11.0.1|24"));
    EXPECT_THAT(Runs("ipv6_change", "v0|"),
                ElementsAre("v0||fd11::1|64", "v0|fd11::1|fd11::2|64", "v0|fd11::2|fd11::3|64"));
    // Nothing of table 100.
    EXPECT_THAT(Runs("gateway_change", "|v0|"),
                ElementsAre("NEW|v0|10.11.0.0|0.0.0.0", "NEW|v0|10.99.0.0|10.11.0.254",
                            "DEL|v0|10.99.0.0|10.11.0.254", "DEL|v0|10.11.0.0|0.0.0.0"));
    EXPECT_THAT(Handlers("v0"), IsEmpty());

    const NetlinkState state = module_->Snapshot();
    EXPECT_EQ(state.overruns, 0u);
    EXPECT_TRUE(state.ipv4Present.at("v0").empty());
    EXPECT_THAT(state.ipv6.at("v0"), ElementsAre("fd11::2", "fd11::3"));
}

}  // namespace
}  // namespace module
}  // namespace network
}  // namespace vornnetwork
