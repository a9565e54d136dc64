#include "utils/string_container.h"

#include <gtest/gtest.h>

#include "support/log_capture.h"

namespace vornwireless {
namespace utils {
namespace {

TEST(StringContainerTest, ParsesTrimmedNonEmptyPieces) {
    EXPECT_EQ(ParseToVector(" a , ,b", ","), StringVector({"a", "b"}));
    EXPECT_EQ(ParseToVector("x;y z", "; "), StringVector({"x", "y", "z"}));
    EXPECT_TRUE(ParseToVector(nullptr, ",").empty());
    EXPECT_TRUE(ParseToVector("a", nullptr).empty());
    EXPECT_EQ(ParseToSet("b,a,b", ","), StringSet({"a", "b"}));
    EXPECT_EQ(ConvertToString(ParseToJsonArray("b, a", ",")), R"(["b","a"])");
}

TEST(StringContainerTest, JoinsAndSlicesWithinTheContainer) {
    const StringVector items = {"a", "b", "c"};
    EXPECT_EQ(ConvertToString(items, ", "), "a, b, c");
    EXPECT_EQ(ConvertToString(items, "+", 1, 1), "b");
    EXPECT_EQ(ConvertToString(items, "+", 2, 5), "c");
    EXPECT_EQ(ConvertToString(StringSet({"z", "y"}), "|", 1), "z");

    Json::Value mixed(Json::arrayValue);
    mixed.append("a");
    mixed.append(1);
    mixed.append(Json::Value(Json::objectValue))["k"] = true;
    EXPECT_EQ(ConvertToString(mixed, "|"), R"(a|1|{"k":true})");
    EXPECT_EQ(ConvertToString(Json::Value("t")), "\"t\"");

    EXPECT_EQ(GetElementInRange(items, 1, 10), StringVector({"b", "c"}));
    EXPECT_EQ(GetElementInRange(items, 0, -1), items);
    EXPECT_TRUE(GetElementInRange(items, 7, 1).empty());
}

TEST(StringContainerTest, RoundTripsThroughPlatformListsAndJson) {
    const StringVector items = {"b", "a", "b"};
    QLIBSZLIST* list = nullptr;
    ASSERT_EQ(ConvertToQLIBList(items, &list), 0);
    EXPECT_EQ(ConvertToVector(list), items);
    EXPECT_EQ(ConvertToSet(list), StringSet({"a", "b"}));
    EXPECT_EQ(ConvertToJsonArray(list), ConvertToJsonArray(items));
    ASSERT_EQ(ConvertToQLIBList(StringSet({"c"}), &list), 0);
    EXPECT_EQ(QLIBCSzListCount(list), 4);
    QLIBCSzListFree(list);
    EXPECT_EQ(ConvertToQLIBList(items, nullptr), -1);
    EXPECT_TRUE(ConvertToVector(static_cast<const QLIBSZLIST*>(nullptr)).empty());

    Json::Value array = ConvertToJsonArray(items);
    array.append(7);
    EXPECT_EQ(ConvertToVector(array), items);
    EXPECT_EQ(ConvertToSet(array), StringSet({"a", "b"}));
    EXPECT_TRUE(ConvertToVector(Json::Value("a")).empty());
}

TEST(StringContainerTest, SearchesAndSetOperations) {
    StringVector items = {"a", "b", "a", "c"};
    EXPECT_EQ(Find("c", items) - items.begin(), 3);
    EXPECT_FALSE(IsExist("d", items));
    Remove("a", items);
    EXPECT_EQ(items, StringVector({"b", "a", "c"}));
    EXPECT_EQ(GetDiff(items, StringVector({"a"})), StringVector({"b", "c"}));
    EXPECT_EQ(GetIntersection(StringSet({"a", "b"}), StringSet({"b", "c"})), StringSet({"b"}));
    EXPECT_EQ(ConvertToVector(ConvertToSet(items)), StringVector({"a", "b", "c"}));

    StringVector repeated = {"x", "y", "x", "z", "y"};
    GetUniqueStrVector(repeated);
    EXPECT_EQ(repeated, StringVector({"x", "y", "z"}));

    vorn::test::LogCapture log;
    Print(repeated);
    EXPECT_EQ(log.Matching("string_container.cpp:").size(), 3u);
}

}  // namespace
}  // namespace utils
}  // namespace vornwireless
