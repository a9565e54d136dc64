#include "platform/qlib_plugin.h"

#include <gmock/gmock.h>
#include <sys/stat.h>

#include <cstdlib>

#include "platform/plugin_timeout.h"
#include "platform/qlibc_error.h"
#include "support/sim_root.h"
#include "support/waiting.h"

namespace vorn::platform {
namespace {

using ::testing::ElementsAre;

const std::string kHookDir = "/etc/vorn/plugins/net/gateway_change.d/";

class QlibPluginTest : public test::RootTest {
  protected:
    ~QlibPluginTest() override {
        SetPluginTimeoutForTests(0);
        QLIBPluginExit(handle_);
    }
    void Script(const std::string& name, const std::string& body, mode_t mode = 0755) {
        root_.WriteFile(kHookDir + name, "#!/bin/sh\n" + body + "\n");
        chmod(root_.Path(kHookDir + name).c_str(), mode);
    }
    // A script body that appends one line to the report file.
    std::string Report(const std::string& words) const {
        return "echo " + words + " >> " + root_.Path("/tmp/report");
    }
    void Open() { ASSERT_EQ(QLIBPluginSDKInit("net", "net/gateway_change", &handle_), 0); }

    QLIBPLUGIN* handle_ = nullptr;
};

TEST_F(QlibPluginTest, RunsExecutableScriptsInNameOrderWithTheirEnvironment) {
    const std::string words =
        "\"${0##*/} $PLUGIN_MODULE $PLUGIN_PATH $PLUGIN_ACTION $IFNAME "
        "$INHERITED $SHADOWED\"";
    Script("20-second", Report(words));
    Script("10-first", Report(words));
    Script("05-not-executable", Report("never"), 0644);
    ASSERT_EQ(mkdir(root_.Path(kHookDir + "15-directory").c_str(), 0755), 0);
    setenv("INHERITED", "kept", 1);
    setenv("SHADOWED", "from-process", 1);
    Open();
    ASSERT_EQ(QLIBPluginSetArg(handle_, "IFNAME", "eth0"), 0);
    ASSERT_EQ(QLIBPluginSetArg(handle_, "SHADOWED", "first"), 0);
    ASSERT_EQ(QLIBPluginSetArg(handle_, "SHADOWED", "from-hook"), 0);
    // The runner's own variables cannot be forged by an argument.
    ASSERT_EQ(QLIBPluginSetArg(handle_, "PLUGIN_ACTION", "99"), 0);
    EXPECT_EQ(QLIBPluginAction(QLIB_PLUGIN_ACTION_AFTER, handle_), 0);
    unsetenv("INHERITED");
    unsetenv("SHADOWED");
    EXPECT_EQ(root_.ReadFile("/tmp/report"),
              "10-first net net/gateway_change 5 eth0 kept from-hook\n"
              "20-second net net/gateway_change 5 eth0 kept from-hook\n");
    EXPECT_TRUE(log_.Lines().empty());
}

TEST_F(QlibPluginTest, FailedAndHangingScriptsAreLoggedAndTheNextStillRuns) {
    SetPluginTimeoutForTests(300);
    Script("10-fails", "exit 3");
    // The hanging script leaves a child in its group; the timeout must take both.
    Script("20-hangs", "sleep 30 & echo $! > " + root_.Path("/tmp/child") + "\nwait\n" +
                           Report("hang-survived"));
    Script("30-killed-by-signal", "kill -TERM $$");
    Script("40-after", Report("after"));
    Open();
    EXPECT_EQ(QLIBPluginAction(QLIB_PLUGIN_ACTION_BEFORE, handle_), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_EXEC);
    EXPECT_EQ(root_.ReadFile("/tmp/report"), "after\n");
    const auto logged = [](const std::string& tail) {
        return ::testing::HasSubstr(kHookDir + tail);
    };
    EXPECT_THAT(log_.Lines(), ElementsAre(logged("10-fails] exited with [3]"),
                                          logged("20-hangs]: still running at its deadline"),
                                          logged("30-killed-by-signal] ended by signal [15]")));

    // The orphaned child is gone (or at most a zombie waiting for its new parent).
    const std::string child = root_.ReadFile("/tmp/child");
    ASSERT_FALSE(child.empty());
    const long pid = std::stol(child);
    EXPECT_TRUE(test::WaitFor([pid] { return test::HasEnded(pid); }, std::chrono::seconds(2)))
        << pid;
}

TEST_F(QlibPluginTest, RefusesBadPathsAndKeys) {
    QLIBPLUGIN* handle = nullptr;
    for (const char* path : {"", "net/../../etc", "/net/x", "net//x", "net/$(reboot)",
                             static_cast<const char*>(nullptr)}) {
        EXPECT_EQ(QLIBPluginSDKInit("net", path, &handle), -1) << path;
        EXPECT_EQ(handle, nullptr) << path;
    }
    EXPECT_EQ(QLIBPluginSDKInit("", "net/x", &handle), -1);
    EXPECT_EQ(QLIBPluginSDKInit("net", "net/x", nullptr), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_INVALID_ARG);

    Open();
    for (const char* key : {"", "1ABC", "A=B"}) {
        EXPECT_EQ(QLIBPluginSetArg(handle_, key, "x"), -1) << key;
    }
    EXPECT_EQ(QLIBPluginSetArg(handle_, "A", "two\nlines"), -1);
    EXPECT_EQ(QLIBPluginSetArg(nullptr, "A", "x"), -1);
    EXPECT_EQ(QLIBPluginSetArg(handle_, "_a1", "any text; $(not run)"), 0);
    EXPECT_EQ(QLIBPluginAction(QLIB_PLUGIN_ACTION_AFTER, nullptr), -1);
    // No directory for the hook point: nothing to run.
    EXPECT_EQ(QLIBPluginAction(QLIB_PLUGIN_ACTION_AFTER, handle_), 0);
}

}  // namespace
}  // namespace vorn::platform
