#include "network/module/clientlist.h"

#include <gmock/gmock.h>

#include <string>

#include "support/sim_root.h"

namespace {

using ::testing::MatchesRegex;
using vornnetwork::network::module::ClientList;

// Tells whether the list's mutex is free, so a path that kept it would show.
class InspectedList : public ClientList {
  public:
    bool IsUnlocked() {
        if (pthread_mutex_trylock(&mutex) != 0) {
            return false;
        }
        pthread_mutex_unlock(&mutex);
        return true;
    }
};

Json::Value Object(std::initializer_list<std::pair<const char*, const char*>> pairs) {
    Json::Value object(Json::objectValue);
    for (const auto& pair : pairs) {
        object[pair.first] = pair.second;
    }
    return object;
}

using ClientListTest = vorn::test::RootTest;

TEST_F(ClientListTest, MergesByMacAndIpAndChoosesDisplayNames) {
    InspectedList list;
    const std::string mac = "aa:bb:cc:dd:ee:01";
    ASSERT_TRUE(
        list.UpdateKeysByMac(mac, Object({{"netif", "br0"}, {"ipAddr", "10.0.0.5"}}), true));
    EXPECT_EQ(list.FindKey(mac, "displayName"), "General DMA");
    EXPECT_THAT(list.FindKey(mac, "asso_time"),
                MatchesRegex("[0-9][0-9]:[0-9][0-9]:[0-9][0-9] [0-9]+/[0-9][0-9]/[0-9][0-9]"));

    // Keys the update lacks are kept; the first non-empty name wins.
    ASSERT_TRUE(list.UpdateKeysByMac(
        mac, Object({{"friendlyName", ""}, {"modelName", "DS-1"}, {"netif", "br1"}}), false));
    Json::Value entry;
    ASSERT_TRUE(list.GetObject(mac, entry));
    EXPECT_EQ(entry["ipAddr"], "10.0.0.5");
    EXPECT_EQ(entry["displayName"], "DS-1");
    ASSERT_TRUE(list.UpdateKeysByMac(mac, Object({{"modelDescription", "Storage"}}), false));
    EXPECT_EQ(list.FindKey(mac, "displayName"), "Storage");
    ASSERT_TRUE(list.UpdateKeysByIP("10.0.0.5", Object({{"friendlyName", "nas"}}), false));
    EXPECT_EQ(list.FindKey(mac, "displayName"), "nas");

    // Unknown clients enter only with add; MACs compare case and all.
    EXPECT_TRUE(list.UpdateKeysByMac("AA:BB:CC:DD:EE:01", Object({{"netif", "x"}}), false));
    EXPECT_TRUE(list.UpdateKeysByIP("10.0.0.6", Object({{"netif", "x"}}), false));
    EXPECT_EQ(list.GetClientList()["ClientList"].size(), 1u);
    ASSERT_TRUE(list.UpdateKeysByIP("10.0.0.6", Object({{"modelName", "TV"}}), true));
    EXPECT_EQ(list.GetClientList()["ClientList"][1]["displayName"], "TV");

    EXPECT_FALSE(list.UpdateKeysByMac("", Object({{"netif", "br0"}}), true));
    EXPECT_FALSE(list.UpdateKeysByIP("", Object({{"netif", "br0"}}), true));
    EXPECT_FALSE(list.UpdateKeysByMac(mac, Json::Value("text"), true));
    EXPECT_TRUE(log_.Contains("Error: UpdateKeys - MAC address is empty"));
    EXPECT_TRUE(log_.Contains("Error: UpdateKeys - json object member number (0)"));
    EXPECT_TRUE(list.IsUnlocked());
}

TEST_F(ClientListTest, SearchesStopAtAnEntryWithoutTheKeyAndEraseMovesTheLastEntry) {
    InspectedList list;
    for (const char* mac : {"aa:00:00:00:00:01", "aa:00:00:00:00:02", "aa:00:00:00:00:03"}) {
        list.UpdateKeysByMac(mac, Object({{"netif", "br0"}}), true);
    }
    list.UpdateKeysByMac("aa:00:00:00:00:01", Object({{"ipAddr", "10.0.0.1"}}), false);
    list.UpdateKeysByMac("aa:00:00:00:00:03", Object({{"ipAddr", "10.0.0.3"}}), false);
    unsigned index = 9;
    EXPECT_TRUE(list.VerifyIPIsExist("10.0.0.1", index));
    EXPECT_EQ(index, 0u);
    EXPECT_EQ(list.FindMacByIP("10.0.0.3"), "");  // hidden behind the second entry
    EXPECT_TRUE(list.VerifyMacIsExist("aa:00:00:00:00:03", index));
    EXPECT_EQ(index, 2u);
    list.UpdateKeysByIP("10.0.0.1", Object({{"ipAddr", "10.0.0.9"}}), false);  // a new lease
    EXPECT_EQ(list.FindMacByIP("10.0.0.1"), "");
    EXPECT_EQ(list.FindMacByIP("10.0.0.9"), "aa:00:00:00:00:01");

    EXPECT_FALSE(list.EraseObject("aa:00:00:00:00:09"));
    EXPECT_TRUE(list.IsUnlocked());
    EXPECT_TRUE(list.EraseObject("aa:00:00:00:00:01"));
    EXPECT_EQ(list.FindMacByIP("10.0.0.3"), "aa:00:00:00:00:03");
    EXPECT_EQ(list.FindMacByIP("10.0.0.9"), "");
    EXPECT_EQ(list.GetClientList()["ClientList"][1]["macAddr"], "aa:00:00:00:00:02");
    EXPECT_TRUE(list.IsUnlocked());
}

TEST_F(ClientListTest, WritesTabIndentedJsonAndLoadsItBack) {
    const std::string file = "/var/packages/Linkyard/target/data//connectionlist_upnpscanner.json";
    root_.WriteFile("/var/packages/Linkyard/target/data/.keep", "");
    ClientList list;
    list.UpdateKeysByMac("aa:00:00:00:00:01", Object({{"friendlyName", "nas"}}), true);
    ASSERT_TRUE(list.WriteToFile(file));
    EXPECT_THAT(root_.ReadFile(file), ::testing::StartsWith("{\n\t\"ClientList\" : \n\t[\n\t\t{"));
    ClientList loaded;
    ASSERT_TRUE(loaded.Load(file));
    EXPECT_EQ(loaded.GetClientList(), list.GetClientList());

    // A damaged file is the device list module's test; a loaded entry is refreshed by the next
    // update.
    root_.WriteFile("/tmp/old.json",
                    "// saved\n{\"ClientList\": [{\"macAddr\": \"aa:00:00:00:00:07\", "
                    "\"netif\": \"br0\", \"asso_time\": \"00:00:00 2000/01/01\"}]}\n");
    ASSERT_TRUE(loaded.LoadClientList("/tmp/old.json"));
    ASSERT_TRUE(
        loaded.UpdateKeysByMac("aa:00:00:00:00:07", Object({{"ipAddr", "10.0.0.7"}}), false));
    EXPECT_NE(loaded.FindKey("aa:00:00:00:00:07", "asso_time"), "00:00:00 2000/01/01");
    EXPECT_EQ(loaded.FindKey("aa:00:00:00:00:07", "netif"), "br0");
    EXPECT_FALSE(list.WriteToFile("/no/such/dir/list.json"));
    EXPECT_TRUE(log_.Contains("Error - /no/such/dir/list.json could not open"));
}

}  // namespace
