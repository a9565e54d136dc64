#include "network/module/devicelist_module.h"

#include <gmock/gmock.h>

#include <filesystem>
#include <map>
#include <string>
#include <vector>

#include "support/sim_root.h"

namespace vornnetwork::network::module {
namespace {

using ::testing::ElementsAre;

constexpr char kDir[] = "/var/packages/Linkyard/target/data/";
constexpr char kFile[] = "/var/packages/Linkyard/target/data//connectionlist_upnpscanner.json";

using vorn::test::Parse;

// The scanners' lists are the test's own; each asked scanner is recorded.
class ListedModule : public DeviceListModule {
  public:
    int GetArpScannerData(Json::Value& out) override { return Give("arp", out); }
    int GetUpnpScannerData(Json::Value& out) override { return Give("upnp", out); }
    int GetCVScannerData(Json::Value& out) override { return Give("cv", out); }
    int GetWifiScannerData(Json::Value& out) override { return Give("wifi", out); }

    std::map<std::string, std::string> lists;  // scanner -> JSON array text; absent: fails
    std::vector<std::string> asked;

  private:
    int Give(const std::string& scanner, Json::Value& out) {
        asked.push_back(scanner);
        const auto found = lists.find(scanner);
        if (found == lists.end()) {
            return -1;
        }
        out["ClientList"] = Parse(found->second);
        return 0;
    }
};

class DeviceListModuleTest : public vorn::test::RootTest {
  protected:
    void SetUp() override {
        std::filesystem::create_directories(root_.Path(kDir));
        module_.lists = {{"arp", "[]"}, {"upnp", "[]"}, {"cv", "[]"}, {"wifi", "[]"}};
    }
    int Send(const std::string& text, Json::Value* answer = nullptr) {
        Json::Value ignored;
        return module_.ProcessRequest(Parse(text), answer != nullptr ? *answer : ignored);
    }
    // The merged list after a "get" "all" with nothing new from the scanners.
    Json::Value All() {
        Json::Value answer;
        EXPECT_EQ(Send(R"({"method":"get","scannertype":"all"})", &answer), 0);
        return answer["ClientList"];
    }
    static std::vector<std::string> Column(const Json::Value& list, const char* key) {
        std::vector<std::string> values;
        for (const Json::Value& client : list) {
            values.push_back(client[key].asString());
        }
        return values;
    }

    ListedModule module_;
};

TEST_F(DeviceListModuleTest, ArpAndWifiAddWhileUpnpAndCvOnlyDescribe) {
    module_.lists["arp"] = R"([
        {"macAddr":"aa:00:00:00:00:01","ipAddr":"10.0.0.2","netif":"br0","friendlyName":"laptop"},
        {"macAddr":"aa:00:00:00:00:02","ipAddr":"10.0.0.3","netif":"br0"}])";
    module_.lists["upnp"] = R"([
        {"ipAddr":"10.0.0.3","friendlyName":"TV","modelName":"Bravia","manufacturer":"Sony"},
        {"ipAddr":"10.0.0.9","friendlyName":"seen only by upnp"}])";
    module_.lists["cv"] = R"([
        {"macAddr":"aa:00:00:00:00:01","deviceType":"nas","manufacturer":"Tessarin"},
        {"macAddr":"aa:00:00:00:00:07","friendlyName":"seen only by cv"}])";
    module_.lists["wifi"] = R"([
        {"macAddr":"aa:00:00:00:00:04","connection":"wifi","netif":"wlan0","signalstrength":80},
        {"macAddr":"aa:00:00:00:00:02","connection":"wifi","netif":"wlan0"}])";

    const Json::Value list = All();
    EXPECT_THAT(module_.asked, ElementsAre("arp", "upnp", "cv", "wifi"));
    EXPECT_THAT(Column(list, "macAddr"),
                ElementsAre("aa:00:00:00:00:01", "aa:00:00:00:00:02", "aa:00:00:00:00:04"));
    EXPECT_THAT(Column(list, "displayName"), ElementsAre("laptop", "TV", "General DMA"));
    // Wifi comes after ARP: the station's interface wins, ARP's address stays.
    EXPECT_EQ(list[1]["netif"], "wlan0");
    EXPECT_EQ(list[1]["ipAddr"], "10.0.0.3");
    // What was answered is what was saved.
    EXPECT_EQ(Parse(root_.ReadFile(kFile))["ClientList"], list);

    // A later CV name outranks the UPnP one on the same client; nobody is added twice.
    module_.lists["cv"] = R"([{"macAddr":"aa:00:00:00:00:02","friendlyName":"NAS"}])";
    EXPECT_THAT(Column(All(), "displayName"), ElementsAre("laptop", "NAS", "General DMA"));
}

TEST_F(DeviceListModuleTest, AFailingStepStopsTheMergeBeforeLaterScannersAndTheFile) {
    module_.lists["arp"] = R"([{"macAddr":"aa:00:00:00:00:01","ipAddr":"10.0.0.2"}])";
    module_.lists.erase("upnp");
    EXPECT_EQ(Send(R"({"method":"get","scannertype":"all"})"), -1);
    EXPECT_THAT(module_.asked, ElementsAre("arp", "upnp"));
    EXPECT_TRUE(log_.Contains(" cannot get upnp data"));
    EXPECT_FALSE(root_.Exists(kFile));
    // An element with neither MAC nor IP ends that list's merge: what follows it is not merged.
    module_.lists["upnp"] = "[]";
    module_.lists["wifi"] = R"([{"macAddr":"aa:00:00:00:00:05"},{"netif":"wlan0"},
                                {"macAddr":"aa:00:00:00:00:06"}])";
    EXPECT_EQ(Send(R"({"method":"get","scannertype":"all"})"), -1);
    EXPECT_TRUE(log_.Contains(" cannot get ip or mac from list object"));
    EXPECT_EQ(module_.MergeList(Parse(R"({"ClientList":{}})"), true), -1);

    // Single-scanner requests answer that scanner's list and merge nothing.
    module_.lists["cv"] = R"([{"macAddr":"aa:00:00:00:00:09","modelName":"TS-9"}])";
    Json::Value answer;
    EXPECT_EQ(Send(R"({"method":"get","scannertype":"cv"})", &answer), 0);
    EXPECT_EQ(answer["ClientList"][0]["modelName"], "TS-9");
    module_.lists.erase("cv");
    EXPECT_EQ(Send(R"({"method":"get","scannertype":"cv"})"), -1);
    EXPECT_TRUE(log_.Contains(" failed to get upnp data"));
    module_.lists["cv"] = module_.lists["wifi"] = "[]";
    EXPECT_THAT(Column(All(), "macAddr"), ElementsAre("aa:00:00:00:00:01", "aa:00:00:00:00:05"));
}

TEST_F(DeviceListModuleTest, SetNamesAKnownClientDelDropsItAndMalformedRequestsChangeNothing) {
    root_.WriteFile(kFile, R"({"ClientList":[{"macAddr":"aa:00:00:00:00:01","ipAddr":"10.0.0.2",
        "userdef_displayName":"Kitchen"},{"macAddr":"aa:00:00:00:00:02","ipAddr":"10.0.0.3"}]})");
    ASSERT_EQ(module_.Initialize(), 0);
    EXPECT_EQ(All()[0]["userdef_displayName"], "Kitchen");
    const std::string saved = root_.ReadFile(kFile);
    EXPECT_EQ(Send(R"({"method":"set","macAddr":"aa:00:00:00:00:02",)"
                   R"("userdef_displayName":"Printer","userdef_deviceType":"printer"})"),
              0);
    EXPECT_EQ(root_.ReadFile(kFile), saved);  // saved at the next "all" or at termination
    EXPECT_EQ(module_.Terminate(), 0);
    EXPECT_EQ(Parse(root_.ReadFile(kFile))["ClientList"][1]["userdef_deviceType"], "printer");

    for (const std::string& bad : std::vector<std::string>{
             R"("macAddr":"AA:00:00:00:00:02","userdef_displayName":"x","userdef_deviceType":"y")",
             R"("macAddr":"aa:00:00:00:00:02","userdef_displayName":"x","userdef_deviceType":"")",
             R"("macAddr":"aa:00:00:00:00:02","userdef_displayName":7,"userdef_deviceType":"y")",
             R"("macAddr":"aa:00:00:00:00:02","userdef_deviceType":"y","userdef_displayName":")" +
                 std::string(257, 'n') + "\""}) {
        EXPECT_EQ(Send(R"({"method":"set",)" + bad + "}"), -1) << bad;
    }
    for (const char* request :
         {R"([1,2])", R"({"method":3})", R"({"method":"put"})",
          R"({"method":"get","scannertype":["all"]})", R"({"method":"set","macAddr":{"a":1}})",
          R"({"method":"del","macAddr":null})", R"({"method":"del","macAddr":""})",
          R"({"method":"del","macAddr":"aa:00:00:00:00:09"})"}) {
        EXPECT_EQ(Send(request), -1) << request;
    }
    EXPECT_TRUE(log_.Contains(" failed to get object (AA:00:00:00:00:02) from list"));
    EXPECT_EQ(All()[1]["userdef_displayName"], "Printer");
    EXPECT_EQ(Send(R"({"method":"del","macAddr":"aa:00:00:00:00:01"})"), 0);
    EXPECT_THAT(Column(All(), "macAddr"), ElementsAre("aa:00:00:00:00:02"));

    // Without the data folder nothing is written; a damaged file is skipped.
    std::filesystem::remove_all(root_.Path(kDir));
    EXPECT_EQ(module_.Terminate(), 0);
    EXPECT_FALSE(log_.Contains("when terminate"));
    root_.WriteFile(kFile, R"({"ClientList":[{"macAddr":)");
    ListedModule fresh;
    ASSERT_EQ(fresh.Initialize(), 0);
    EXPECT_TRUE(log_.Contains(" failed to read (" + std::string(kFile) + ") to client list"));
}

}  // namespace
}  // namespace vornnetwork::network::module
