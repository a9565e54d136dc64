#include "network/module/cvscanner.h"

#include <gmock/gmock.h>
#include <sys/stat.h>

#include <chrono>
#include <string>
#include <thread>

#include "platform/qlibc_error.h"
#include "platform/vorn_net.h"
#include "support/sim_root.h"
#include "utils/json_text.h"

namespace {

using vornnetwork::network::module::CVScanner;

const char kDumpFile[] = "/tmp/vorncv.list.tmp";
const char kListFile[] = "/tmp/linkyard_cvscanner_list.tmp";
const char kDiscovery[] = "/usr/vorn/bin/fhost";

class CVScannerTest : public vorn::test::RootTest {
  protected:
    void SetUp() override { scanner_->EraseList(); }
    void TearDown() override { WaitForDiscovery(); }

    static void WaitForDiscovery() {
        for (int i = 0; i < 1000 && CVScanner::IsScanning(); ++i) {
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        ASSERT_FALSE(CVScanner::IsScanning());
    }
    // A discovery program that writes its list to the file it is given after "--dump".
    void InstallDiscovery(const std::string& body) {
        root_.WriteFile(kDiscovery, "#!/bin/sh\n" + body);
        ASSERT_EQ(chmod(root_.Path(kDiscovery).c_str(), 0755), 0);
    }
    Json::Value Clients() { return scanner_->GetClientList()["ClientList"]; }

    CVScanner* scanner_ = CVScanner::Inst();
};

TEST_F(CVScannerTest, ListLinesFollowTheRules) {
    EXPECT_EQ(scanner_->ReadFHOSTListFile(), 0);  // no list yet
    EXPECT_TRUE(Clients().empty());

    const std::string list =
        "1,250,nas-one,192.168.1.30,00:11:32:00:00:01\r\n"
        "1,239,old-nas,192.168.1.31,00:11:32:00:00:02\n"
        "0,250,zero,192.168.1.32,00:11:32:00:00:03\n"
        "1,250,short\n"
        "1,260,evil,1.2.3.4;reboot,00:11:32:00:00:05\n" +
        std::string(3000, '7') + ",250,long,192.168.1.35,00:11:32:00:00:06\n" +
        "2,255,nas-two,192.168.1.34,00:11:32:00:00:04";
    root_.WriteFile(kDumpFile, list);
    ASSERT_EQ(scanner_->ReadFHOSTListFile(), 0);
    EXPECT_EQ(root_.ReadFile(kListFile), list);
    const Json::Value clients = Clients();
    ASSERT_EQ(clients.size(), 2u);
    Json::Value first = clients[0];
    first.removeMember("asso_time");
    EXPECT_EQ(vornwireless::utils::CompactJson(first),
              R"({"deviceType":"nas","displayName":"nas-one","friendlyName":"nas-one",)"
              R"("ipAddr":"192.168.1.30","macAddr":"00:11:32:00:00:01",)"
              R"("manufacturer":"Tessarin","modelName":"250"})");
    EXPECT_EQ(clients[1]["macAddr"], "00:11:32:00:00:04");
    EXPECT_EQ(log_.Matching("cvscanner.cpp:").size(), 3u);  // one per bad line
    EXPECT_TRUE(log_.Contains("cvscanner skips a host with a bad address"));

    // Without a fresh dump the last copied list is read again.
    scanner_->EraseList();
    ASSERT_EQ(unlink(root_.Path(kDumpFile).c_str()), 0);
    ASSERT_EQ(scanner_->ReadFHOSTListFile(), 0);
    EXPECT_EQ(Clients().size(), 2u);
}

TEST_F(CVScannerTest, DiscoveryFailuresAreLoggedAndLeaveTheListAlone) {
    EXPECT_EQ(VORNFHOSTDumpHost(), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_NOT_FOUND);
    EXPECT_TRUE(log_.Contains("No host discovery program [/usr/vorn/bin/fhost]"));

    scanner_->GetData();
    WaitForDiscovery();
    EXPECT_TRUE(log_.Contains("VORNFHOSTDumpHost() failed!! vornerr=[0x0400]"));

    root_.WriteFile(kDumpFile, "1,250,nas-one,192.168.1.30,00:11:32:00:00:01\n");
    InstallDiscovery("echo partial > \"$2\"\nexit 1\n");
    EXPECT_EQ(VORNFHOSTDumpHost(), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_EXEC);
    EXPECT_EQ(root_.ReadFile(kDumpFile), "1,250,nas-one,192.168.1.30,00:11:32:00:00:01\n");
    EXPECT_FALSE(root_.Exists("/tmp/vorncv.list.tmp.part"));
}

}  // namespace
