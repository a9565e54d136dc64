#include "hook/base_hook.h"

#include <gmock/gmock.h>
#include <sys/stat.h>

#include <string>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace vornwireless::hook {
namespace {

using BaseHookTest = vorn::test::RootTest;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST_F(BaseHookTest, HooksPassTheirArgumentsToTheScripts) {
    root_.RecordHook("gateway_change", "$ACTION $IFNAME $DESTINATION $GATEWAY $PLUGIN_ACTION");
    root_.RecordHook("topology_change", "$OLD_TOPOLOGY>$NEW_TOPOLOGY");
    root_.RecordHook("arp_ignore_change", "$NEW_VALUE");
    root_.RecordHook("bond_change", "$ACTION");

    EXPECT_TRUE(GatewayChangeHook("NEW", "eth0", "", "10.0.0.1").ExecHook(5));
    EXPECT_TRUE(GatewayChangeHook("DEL", "eth0", "10.1.0.0", "").ExecHook(5));
    EXPECT_THAT(root_.HookRuns("gateway_change"),
                ElementsAre("NEW eth0 0.0.0.0 10.0.0.1 5", "DEL eth0 10.1.0.0 0.0.0.0 5"));
    EXPECT_TRUE(TopologyChangeHook("router", "bridge").ExecHook(QLIB_PLUGIN_ACTION_BEFORE));
    EXPECT_TRUE(ArpIgnoreChangeHook(true).ExecHook(5));
    EXPECT_TRUE(BondChangeHook("add").ExecHook(5));
    EXPECT_THAT(root_.HookRuns("topology_change"), ElementsAre("router>bridge"));
    EXPECT_THAT(root_.HookRuns("arp_ignore_change"), ElementsAre("true"));
    EXPECT_THAT(root_.HookRuns("bond_change"), ElementsAre("add"));
    EXPECT_TRUE(log_.Lines().empty());
}

TEST_F(BaseHookTest, InvalidOrBrokenHooksFailWithOneLogLineAndRunNothing) {
    root_.RecordHook("gateway_change", "$ACTION");
    root_.RecordHook("ipv4_change", "$NEW_ADDRESS");
    EXPECT_FALSE(GatewayChangeHook("", "eth0", "", "").ExecHook(5));
    EXPECT_FALSE(TopologyChangeHook("router", "").ExecHook(4));
    EXPECT_EQ(log_.Matching("Hook environment is not valid").size(), 2u);
    EXPECT_EQ(log_.Matching("base_hook.cpp:").size(), 2u);

    BaseHook unopened("net", "../etc");
    EXPECT_EQ(unopened.SetEnv("A", "b"), -1);
    EXPECT_FALSE(unopened.ExecHook(5));
    EXPECT_TRUE(log_.Contains("Failed to init hook in module [net] and path [../etc]"));
    EXPECT_EQ(log_.Matching("Not init or init failed").size(), 2u);

    GatewayChangeHook forged("NEW", "eth0\nACTION=DEL", "", "");
    EXPECT_TRUE(log_.Contains("Failed to set plugin argument key=IFNAME value=eth0\nACTION=DEL"));
    EXPECT_FALSE(forged.ExecHook(5));

    // Addresses out of range or of no family run nothing; valid ones are the netlink tests'.
    EXPECT_FALSE(NetIPChangeEvent(IPTYPE_IPV4, "eth0", "none", "10.0.0.5", 33));
    EXPECT_FALSE(NetIPChangeEvent(IPTYPE_IPV6, "eth0", "", "2001:db8::3", 129));
    EXPECT_FALSE(NetIPChangeEvent(static_cast<IPTYPE>(2), "eth0", "none", "10.0.0.5", 24));
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_INVALID_ARG);
    EXPECT_THAT(root_.HookRuns("gateway_change"), IsEmpty());
    EXPECT_THAT(root_.HookRuns("ipv4_change"), IsEmpty());

    // A failing script fails the hook.
    const std::string failing = "/etc/vorn/plugins/net/ipv4_change.d/20-fail";
    root_.WriteFile(failing, "#!/bin/sh\nexit 1\n");
    chmod(root_.Path(failing).c_str(), 0755);
    QLIBCErrSet(QLIBC_ERR_NONE);
    EXPECT_FALSE(NetIPChangeEvent(IPTYPE_IPV4, "eth0", "10.0.0.4", "10.0.0.6", 24));
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_EXEC);
    EXPECT_TRUE(log_.Contains("Failed to exec hook at action [5]"));
}

}  // namespace
}  // namespace vornwireless::hook
