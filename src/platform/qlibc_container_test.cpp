#include "platform/qlibc_container.h"

#include <gtest/gtest.h>

#include <string>

namespace {

TEST(QlibcContainerTest, HashKeepsInsertionOrderAndReplacesInPlace) {
    QLIBSZHASH* hash = QLIBCSzHashAlloc(2);
    for (const char* key : {"z", "a", "m"}) {
        ASSERT_EQ(QLIBCSzHashSetValue(hash, key, key), 0);
    }
    ASSERT_EQ(QLIBCSzHashSetValue(hash, "a", "new"), 0);
    ASSERT_EQ(QLIBCSzHashRemove(hash, "z"), 0);
    EXPECT_EQ(QLIBCSzHashRemove(hash, "z"), -1);
    std::string dump;
    for (int i = 0; i < QLIBCSzHashCount(hash); ++i) {
        dump += std::string(QLIBCSzHashKeyAt(hash, i)) + "=" + QLIBCSzHashValueAt(hash, i) + ";";
    }
    EXPECT_EQ(dump, "a=new;m=m;");
    // The index still finds entries that moved up.
    EXPECT_STREQ(QLIBCSzHashGetValue(hash, "m"), "m");
    EXPECT_EQ(QLIBCSzHashGetValue(hash, "z"), nullptr);
    EXPECT_EQ(QLIBCSzHashKeyAt(hash, 2), nullptr);
    EXPECT_EQ(QLIBCSzHashSetValue(hash, nullptr, "v"), -1);
    QLIBCHashRemoveAll(hash);
    EXPECT_EQ(QLIBCSzHashGetValue(hash, "a"), nullptr);
    QLIBCSzHashFree(hash);

    QLIBSZLIST* list = QLIBCSzListAlloc(1);
    ASSERT_EQ(QLIBCSzListAdd(list, "x"), 0);
    ASSERT_EQ(QLIBCSzListAdd(list, "x"), 0);
    EXPECT_STREQ(QLIBCSzListGet(list, 1), "x");
    EXPECT_EQ(QLIBCSzListGet(list, 2), nullptr);
    EXPECT_EQ(QLIBCSzListGet(list, -1), nullptr);
    QLIBCSzListRemoveAll(list);
    EXPECT_EQ(QLIBCSzListCount(list), 0);
    QLIBCSzListFree(list);
}

}  // namespace
