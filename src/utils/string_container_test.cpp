#include "utils/string_container.h"

#include <gtest/gtest.h>

namespace vornwireless::utils {
namespace {

TEST(StringContainerTest, ParsesJoinsAndSlices) {
    EXPECT_EQ(ParseToVector(" a , ;b", ",;"), StringVector({"a", "b"}));
    EXPECT_TRUE(ParseToVector(nullptr, ",").empty());
    EXPECT_EQ(ParseToSet("b,a,b", ","), StringSet({"a", "b"}));
    EXPECT_EQ(ConvertToString(ParseToJsonArray("b, a", ",")), R"(["b","a"])");
    const StringVector items = {"a", "b", "c"};
    EXPECT_EQ(ConvertToString(items, ", "), "a, b, c");
    EXPECT_EQ(ConvertToString(items, "+", 2, 5), "c");
    EXPECT_EQ(ConvertToString(StringSet({"z", "y"}), "|", 1), "z");
    Json::Value mixed(Json::arrayValue);
    mixed.append("a");
    mixed.append(1);
    mixed.append(Json::Value(Json::objectValue))["k"] = true;
    EXPECT_EQ(ConvertToString(mixed, "|"), R"(a|1|{"k":true})");
    EXPECT_EQ(GetElementInRange(items, 1, 10), StringVector({"b", "c"}));
    EXPECT_TRUE(GetElementInRange(items, 7, 1).empty());
}

TEST(StringContainerTest, RoundTripsThroughPlatformListsAndJsonAndSets) {
    StringVector items = {"b", "a", "b"};
    QLIBSZLIST* list = nullptr;
    ASSERT_EQ(ConvertToQLIBList(items, &list), 0);
    EXPECT_EQ(ConvertToVector(list), items);
    EXPECT_EQ(ConvertToJsonArray(list), ConvertToJsonArray(items));
    ASSERT_EQ(ConvertToQLIBList(StringSet({"c"}), &list), 0);
    EXPECT_EQ(ConvertToSet(list), StringSet({"a", "b", "c"}));
    QLIBCSzListFree(list);
    EXPECT_EQ(ConvertToQLIBList(items, nullptr), -1);
    Json::Value array = ConvertToJsonArray(items);
    array.append(7);
    EXPECT_EQ(ConvertToVector(array), items);
    EXPECT_EQ(ConvertToSet(array), ConvertToSet(items));
    EXPECT_TRUE(ConvertToVector(Json::Value("a")).empty());

    items.push_back("c");
    Remove("b", items);
    EXPECT_EQ(items, StringVector({"a", "b", "c"}));
    EXPECT_FALSE(IsExist("d", items));
    EXPECT_EQ(GetDiff(items, StringVector({"a"})), StringVector({"b", "c"}));
    EXPECT_EQ(ConvertToVector(GetIntersection(StringSet({"a", "b"}), StringSet({"b", "c"}))),
              StringVector({"b"}));
    StringVector repeated = {"x", "y", "x", "z", "y"};
    GetUniqueStrVector(repeated);
    EXPECT_EQ(repeated, StringVector({"x", "y", "z"}));
}

}  // namespace
}  // namespace vornwireless::utils
