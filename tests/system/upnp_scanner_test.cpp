// The UPnP scanner against a real media server: minidlna in a namespace of its own at the far
// end of a veth pair, the scanner's SSDP search and description download on this side.
#include "network/module/upnpscanner.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <fstream>

#include "support/peer_namespace.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using vorn::test::WaitFor;

constexpr char kServerAddress[] = "10.77.0.2";
constexpr char kFriendlyName[] = "Vorn Test Media";
constexpr char kModelName[] = "Vorn DLNA 7";

// The entry the scanner keeps for the media server, or null.
Json::Value ServerEntry(const Json::Value& list) {
    for (const Json::Value& device : list["ClientList"]) {
        if (device["ipAddr"] == kServerAddress) {
            return device;
        }
    }
    return Json::Value();
}

class UpnpScannerSystemTest : public vorn::test::PeerNamespaceTest {
  protected:
    void SetUpPeers() override {
        if (!std::filesystem::exists("/usr/sbin/minidlnad")) {
            GTEST_SKIP() << "minidlna is not installed";
        }
        AddPeer("dlna", "u0", 11, "d0", 21);
        Ip("addr add 10.77.0.1/24 dev u0");
        Ip(std::string("-n dlna addr add ") + kServerAddress + "/24 dev d0");
        // Without a multicast route the search goes nowhere, and says nothing.
        Ip("route add 224.0.0.0/4 dev u0");
        Ip("-n dlna route add 224.0.0.0/4 dev d0");

        const std::string dir = root_->Dir() + "/dlna";
        std::filesystem::create_directories(dir + "/media");
        std::ofstream(dir + "/minidlna.conf")
            << "media_dir=" << dir << "/media\ndb_dir=" << dir << "\nlog_dir=" << dir
            << "\nnetwork_interface=d0\nport=8200\ninotify=no\nfriendly_name=" << kFriendlyName
            << "\nmodel_name=" << kModelName << "\n";
        vorn::test::DaemonProcess& server =
            Start({"/usr/sbin/minidlnad", "-d", "-f", dir + "/minidlna.conf", "-P",
                   dir + "/minidlna.pid"},
                  "dlna");
        const std::string connect = "/bin/bash -c 'echo >/dev/tcp/" + std::string(kServerAddress) +
                                    "/8200' 2>/dev/null; echo $?";
        ASSERT_TRUE(
            WaitFor([&] { return vorn::test::Shell(connect) == "0\n"; }, std::chrono::seconds(10)))
            << server.Stdout() << server.Stderr();
    }

    // Waits until the running search has found the server, then until it has ended; a search
    // collects answers for 13 seconds.
    Json::Value SearchResult(UpnpScanner& scanner) {
        Json::Value found;
        EXPECT_TRUE(WaitFor([&] {
            found = ServerEntry(scanner.GetClientList());
            return !found.isNull();
        }));
        EXPECT_TRUE(WaitFor([] { return !UpnpScanner::IsSearching(); }));
        return found;
    }
};

TEST_F(UpnpScannerSystemTest, SearchFindsTheMediaServerWithItsDescriptionsNames) {
    UpnpScanner& scanner = *UpnpScanner::Inst();
    // The first call starts a search; its results are handed over by a later call.
    EXPECT_TRUE(ServerEntry(scanner.GetData()).isNull());
    EXPECT_TRUE(UpnpScanner::IsSearching());

    const Json::Value found = SearchResult(scanner);
    EXPECT_EQ(found["friendlyName"], kFriendlyName);
    EXPECT_EQ(found["displayName"], kFriendlyName);
    EXPECT_EQ(found["modelName"], kModelName);
    EXPECT_THAT(found["deviceType"].asString(),
                HasSubstr("urn:schemas-upnp-org:device:MediaServer"));
    EXPECT_FALSE(found["manufacturer"].asString().empty());
    EXPECT_FALSE(found["asso_time"].asString().empty());
    EXPECT_FALSE(found.isMember("macAddr"));

    // Every answer, repeated or not, lands on the one entry of its address.
    const Json::Value handedOver = scanner.GetData();
    ASSERT_EQ(handedOver["ClientList"].size(), 1u);
    EXPECT_EQ(handedOver["ClientList"][0]["friendlyName"], kFriendlyName);

    // That call started the next search, which finds the server again.
    EXPECT_EQ(SearchResult(scanner)["modelName"], kModelName);
    EXPECT_THAT(log_.Matching("upnpscanner.cpp"), IsEmpty());
}

}  // namespace
}  // namespace module
}  // namespace network
}  // namespace vornnetwork
