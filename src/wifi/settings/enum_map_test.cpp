#include "wifi/settings/enum_map.h"

#include <gtest/gtest.h>

#include "support/log_capture.h"

namespace vornwireless {
namespace wifi {
namespace {

TEST(EnumMapTest, ValuesStringsAndAliases) {
    vorn::test::LogCapture log;
    // The numbers other files carry.
    EXPECT_EQ(EnumMap<WIFI_MODE>::EnumToString(WIFI_MODE(11)), "an+ac");
    EXPECT_EQ(EnumMap<WIFI_STATUS>::EnumToString(WIFI_STATUS(2)), "IPConflict");
    EXPECT_EQ(EnumMap<WIFI_POWER>::EnumToString(WIFI_POWER(6)), "medium");
    EXPECT_EQ(EnumMap<WIFI_POWER>::EnumToString(WIFI_POWER(5)), "error");  // a gap

    // Aliases parse; the key-order walk answers with the byte-wise first alias.
    for (const char* word : {"Managed", "Infra", "In", "Any"}) {
        EXPECT_EQ(EnumMap<WIFI_OPMODE>::StringToEnum(word), WIFI_OPMODE_MANAGED) << word;
    }
    EXPECT_EQ(EnumMap<WIFI_OPMODE>::StringToEnum("Adhoc"), WIFI_OPMODE_AD_HOC);
    const char* expected[] = {"Auto", "Ad", "Any", "Master", "Repeater", "Secondary", "Monitor"};
    for (int value = 0; value <= 6; ++value) {
        EXPECT_EQ(EnumMap<WIFI_OPMODE>::EnumToString(WIFI_OPMODE(value)), expected[value]);
    }
    EXPECT_TRUE(log.Lines().empty());

    // Lookups are exact; a miss logs and yields the table's error value.
    EXPECT_EQ(EnumMap<WIFI_ENCRYPTION>::StringToEnum("AES"), 3);
    EXPECT_EQ(EnumMap<WIFI_ENCRYPTION>::StringToEnum("aes"), 0);
    EXPECT_EQ(EnumMap<WIFI_OPMODE>::StringToEnum("Mesh"), -1);
    EXPECT_EQ(log.Lines(), (std::vector<std::string>{
                               "libvornwireless/include/wifi/enum:286 Failed to find key(aes)",
                               "libvornwireless/include/wifi/enum:286 Failed to find key(Mesh)"}));
}

}  // namespace
}  // namespace wifi
}  // namespace vornwireless
