// The UPnP scanner against a real media server: minidlna in a namespace of its own at the far
// end of a veth pair, the scanner's SSDP search and description download on this side.
#include "network/module/upnpscanner.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <sys/mount.h>
#include <sys/socket.h>
#include <unistd.h>

#include <gmock/gmock.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "support/log_capture.h"
#include "support/net_namespace.h"
#include "support/private_bus.h"
#include "support/waiting.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

using vorn::test::WaitFor;

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using vorn::test::DaemonProcess;
using vorn::test::RunProgram;

constexpr char kServerAddress[] = "10.77.0.2";
constexpr char kFriendlyName[] = "Vorn Test Media";
constexpr char kModelName[] = "Vorn DLNA 7";

// A search collects answers for 13 seconds; a little more covers start-up and teardown.

bool AcceptsConnections(const char* address, std::uint16_t port) {
    const int fd = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_in server{};
    server.sin_family = AF_INET;
    server.sin_port = htons(port);
    inet_pton(AF_INET, address, &server.sin_addr);
    const bool connected = connect(fd, reinterpret_cast<sockaddr*>(&server), sizeof server) == 0;
    close(fd);
    return connected;
}

// The entry the scanner keeps for the media server, or null.
Json::Value ServerEntry(const Json::Value& list) {
    for (const Json::Value& device : list["ClientList"]) {
        if (device["ipAddr"] == kServerAddress) {
            return device;
        }
    }
    return Json::Value();
}

class UpnpScannerSystemTest : public ::testing::Test {
  protected:
    void SetUp() override {
        VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP();
        if (!std::filesystem::exists("/usr/sbin/minidlnad")) {
            GTEST_SKIP() << "minidlna is not installed";
        }
        // "ip netns" keeps its namespaces under /run: a private one leaves nothing on the host.
        ASSERT_EQ(mount("tmpfs", "/run", "tmpfs", 0, nullptr), 0);
        mounted_ = true;
        char dir[] = "/tmp/upnp-scanner-XXXXXX";
        ASSERT_NE(mkdtemp(dir), nullptr);
        dir_ = dir;
        Ip({"netns", "add", "dlna"});
        Ip({"link", "add", "u0", "index", "11", "type", "veth", "peer", "name", "d0", "netns",
            "dlna", "index", "21"});
        Ip({"addr", "add", "10.77.0.1/24", "dev", "u0"});
        // libupnp binds to the link-local address too, which must not be tentative then.
        std::ofstream("/proc/sys/net/ipv6/conf/u0/accept_dad") << "0\n";
        Ip({"link", "set", "u0", "up"});
        // Without a multicast route the search goes nowhere, and says nothing.
        Ip({"route", "add", "224.0.0.0/4", "dev", "u0"});
        Ip({"-n", "dlna", "addr", "add", std::string(kServerAddress) + "/24", "dev", "d0"});
        Ip({"-n", "dlna", "link", "set", "lo", "up"});
        Ip({"-n", "dlna", "link", "set", "d0", "up"});
        Ip({"-n", "dlna", "route", "add", "224.0.0.0/4", "dev", "d0"});
        StartMediaServer();
    }

    void TearDown() override {
        server_.reset();
        if (!dir_.empty()) {
            std::filesystem::remove_all(dir_);
        }
        if (mounted_) {
            RunProgram({"/sbin/ip", "netns", "del", "dlna"}, std::chrono::seconds(10));
            EXPECT_EQ(umount2("/run", MNT_DETACH), 0);
        }
    }

    void Ip(const std::vector<std::string>& arguments) {
        std::vector<std::string> argv{"/sbin/ip"};
        argv.insert(argv.end(), arguments.begin(), arguments.end());
        std::string err;
        ASSERT_EQ(RunProgram(argv, std::chrono::seconds(10), nullptr, &err), 0) << err;
    }

    void StartMediaServer() {
        std::filesystem::create_directories(dir_ + "/media");
        const std::string conf = dir_ + "/minidlna.conf";
        std::ofstream(conf) << "media_dir=" << dir_ << "/media\n"
                            << "db_dir=" << dir_ << "\nlog_dir=" << dir_ << "\n"
                            << "network_interface=d0\nport=8200\ninotify=no\n"
                            << "friendly_name=" << kFriendlyName << "\n"
                            << "model_name=" << kModelName << "\n";
        server_ = std::make_unique<DaemonProcess>(
            std::vector<std::string>{"/sbin/ip", "netns", "exec", "dlna", "/usr/sbin/minidlnad",
                                     "-d", "-f", conf, "-P", dir_ + "/minidlna.pid"});
        ASSERT_TRUE(server_->Started());
        ASSERT_TRUE(WaitFor([] { return AcceptsConnections(kServerAddress, 8200); },
                            std::chrono::seconds(10)))
            << server_->Stdout() << server_->Stderr();
    }

    // Waits until the running search has found the server, then until it has ended.
    Json::Value SearchResult(UpnpScanner& scanner) {
        Json::Value found;
        EXPECT_TRUE(WaitFor(
            [&] {
                found = ServerEntry(scanner.GetClientList());
                return !found.isNull();
            },
            std::chrono::seconds(20)));
        EXPECT_TRUE(WaitFor([] { return !UpnpScanner::IsSearching(); }, std::chrono::seconds(20)));
        return found;
    }

    vorn::test::LogCapture log_;
    std::string dir_;
    bool mounted_ = false;
    std::unique_ptr<DaemonProcess> server_;
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
