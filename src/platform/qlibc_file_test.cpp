#include "platform/qlibc_file.h"

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <utility>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace {

using Pairs = std::vector<std::pair<std::string, std::string>>;
using Hash = std::unique_ptr<QLIBSZHASH, void (*)(QLIBSZHASH*)>;

Hash MakeHash(const Pairs& pairs) {
    Hash hash(QLIBCSzHashAlloc(16), QLIBCSzHashFree);
    for (const auto& pair : pairs) {
        QLIBCSzHashSetValue(hash.get(), pair.first.c_str(), pair.second.c_str());
    }
    return hash;
}

Pairs ToPairs(const QLIBSZHASH* hash) {
    Pairs pairs;
    for (int i = 0; i < QLIBCSzHashCount(hash); ++i) {
        pairs.emplace_back(QLIBCSzHashKeyAt(hash, i), QLIBCSzHashValueAt(hash, i));
    }
    return pairs;
}

// The result of a section read and the pairs it gave.
std::pair<int, Pairs> Section(const char* file, const char* name) {
    QLIBSZHASH* raw = nullptr;
    const int found = QLIBCFileGetSection(file, name, &raw);
    const Hash hash(raw, QLIBCSzHashFree);
    return {found, ToPairs(raw)};
}

using QlibcFileTest = vorn::test::RootTest;

TEST_F(QlibcFileTest, SectionFilesReadByTheLineRules) {
    root_.WriteFile("/etc/s.conf",
                    "stray=ignored\r\n# comment\r\n[b]\r\n\tkey=one\r\n  other = spaced=value \r\n"
                    "; another comment\n\nkey=two\n[a]\n[b]\nthird=3\r");
    QLIBSZLIST* list = nullptr;
    ASSERT_EQ(QLIBCFileEnumSection("/etc/s.conf", &list), 2);
    EXPECT_STREQ(QLIBCSzListGet(list, 0), "b");
    EXPECT_STREQ(QLIBCSzListGet(list, 1), "a");
    QLIBCSzListRemoveAll(list);
    // A repeated key keeps its first place and its last value; blocks of one name merge; the
    // value is kept verbatim after the first "=".
    EXPECT_EQ(
        Section("/etc/s.conf", "b"),
        std::make_pair(3, Pairs{{"key", "two"}, {"other", " spaced=value "}, {"third", "3"}}));
    EXPECT_EQ(Section("/etc/s.conf", "a"), std::make_pair(0, Pairs{}));
    EXPECT_EQ(Section("/etc/s.conf", "absent").first, 0);

    root_.WriteFile("/etc/nul.conf", std::string("[a]\nk=v\0w\n", 11));
    root_.WriteFile("/etc/long.conf", "[a]\nk=" + std::string(9000, 'x') + "\n");
    root_.WriteFile("/etc/huge.conf", std::string(1024 * 1024 + 1, '\n'));
    char value[64];
    for (const char* file : {"/etc/nul.conf", "/etc/long.conf", "/etc/huge.conf"}) {
        EXPECT_EQ(QLIBCFileEnumSection(file, &list), -1) << file;
        EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_FORMAT) << file;
        EXPECT_EQ(QLIBCFileGetKeyValue(file, "k", value, sizeof(value), 0), -1) << file;
    }
    EXPECT_EQ(QLIBCFileEnumSection("/etc/missing.conf", &list), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_NOT_FOUND);
    QLIBCSzListFree(list);
}

TEST_F(QlibcFileTest, KeyFilesUnquoteAndUpdateInPlace) {
    const char* file = "/etc/vorninfo.conf";
    root_.WriteFile(
        file, "# factory\nnet_topology=\"router\"\ndns_mode=AUTO\nempty=\"\"\n\ndns_mode=Auto\n");
    char value[64] = "junk";
    EXPECT_EQ(QLIBCFileGetKeyValue(file, "net_topology", value, sizeof(value), 0), 1);
    EXPECT_STREQ(value, "router");
    std::strcpy(value, "junk");
    EXPECT_EQ(QLIBCFileGetKeyValue(file, "absent", value, sizeof(value), 0), 0);
    EXPECT_STREQ(value, "");
    EXPECT_EQ(QLIBCFileGetKeyValue(file, "net_topology", value, 4, 0), -1);
    EXPECT_EQ(QLIBCFileCheckKeyValue(file, "dns_mode", "auto", 0), 0);
    EXPECT_EQ(QLIBCFileCheckKeyValue(file, "dns_mode", "auto", QLIBC_FILE_IGNORE_CASE), 1);

    // Quoted values stay quoted, every occurrence changes, other lines stay, new keys go last.
    ASSERT_EQ(QLIBCFileSetKeyValue(file, "net_topology", "bridge"), 0);
    ASSERT_EQ(QLIBCFileSetKeyValue(file, "dns_mode", "manual"), 0);
    ASSERT_EQ(QLIBCFileSetKeyValue(file, "added", "1"), 0);
    EXPECT_EQ(QLIBCFileSetKeyValue(file, "bad", "two\nlines"), -1);
    EXPECT_EQ(root_.ReadFile(file),
              "# factory\nnet_topology=\"bridge\"\ndns_mode=manual\nempty=\"\"\n\ndns_mode=manual\n"
              "added=1\n");

    ASSERT_EQ(QLIBCFileSetKeys(file, MakeHash({{"added", "2"}, {"fresh", "new value"}}).get(),
                               MakeHash({{"empty", ""}}).get(), QLIBC_FILE_QUOTE_VALUES),
              0);
    // Values already in the file keep their quoting; new ones take the flag's.
    EXPECT_EQ(root_.ReadFile(file),
              "# factory\nnet_topology=\"bridge\"\ndns_mode=manual\n\ndns_mode=manual\n"
              "added=2\nfresh=\"new value\"\n");
    ASSERT_EQ(QLIBCFileSetKeyValue("/etc/sysconfig/network-scripts/ifcfg-new", "DEVICE", "new"), 0);
    EXPECT_EQ(root_.ReadFile("/etc/sysconfig/network-scripts/ifcfg-new"), "DEVICE=new\n");
}

TEST_F(QlibcFileTest, SectionsWriteAndReadBack) {
    const Hash pairs = MakeHash({{"ifname", "eth0"}, {"gateway", " 10.0.0.1"}, {"note", "a=b #c"}});
    FILE* stream = std::fopen(root_.Path("/etc/w.conf").c_str(), "w");
    ASSERT_NE(stream, nullptr);
    ASSERT_EQ(QLIBCFileHash2File(stream, "0", pairs.get(), "\t%s=%s\n"), 0);
    // Pairs, names and formats that would not read back are refused before anything is written.
    for (const Pairs& bad : {Pairs{{"k", "two\nlines"}}, Pairs{{"a=b", "v"}}, Pairs{{"", "v"}}}) {
        EXPECT_EQ(QLIBCFileHash2File(stream, "1", MakeHash(bad).get(), "\t%s=%s\n"), -1);
    }
    EXPECT_EQ(QLIBCFileHash2File(stream, "x]", pairs.get(), "\t%s=%s\n"), -1);
    EXPECT_EQ(QLIBCFileHash2File(stream, "1", pairs.get(), "%s=%d\n"), -1);
    EXPECT_EQ(QLIBCFileHash2File(stream, "1", pairs.get(), "%s\n"), -1);
    std::fclose(stream);
    EXPECT_EQ(root_.ReadFile("/etc/w.conf"),
              "[0]\n\tifname=eth0\n\tgateway= 10.0.0.1\n\tnote=a=b #c\n");
    EXPECT_EQ(Section("/etc/w.conf", "0").second, ToPairs(pairs.get()));

    // AddSection replaces a section where it stands and appends a new one.
    root_.WriteFile("/etc/r.conf", "[conf]\nold=1\n[addr]\na=1\n[conf]\nold=2\n");
    ASSERT_EQ(QLIBCFileAddSection("/etc/r.conf", "conf", MakeHash({{"k", "v"}}).get(), "\t%s=%s\n"),
              0);
    ASSERT_EQ(QLIBCFileAddSection("/etc/r.conf", "lan", MakeHash({{"p", "q"}}).get(), "\t%s=%s\n"),
              0);
    EXPECT_EQ(root_.ReadFile("/etc/r.conf"), "[conf]\n\tk=v\n[addr]\na=1\n[lan]\n\tp=q\n");
    EXPECT_EQ(QLIBCFileAddSection("/etc/new/r.conf", "conf", pairs.get(), "\t%s=%s\n"), -1);
}

}  // namespace
