#include "platform/qlibc_file.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "platform/qlibc_error.h"
#include "support/sim_root.h"

namespace {

using Pairs = std::vector<std::pair<std::string, std::string>>;

struct HashDeleter {
    void operator()(QLIBSZHASH* hash) const { QLIBCSzHashFree(hash); }
};
using Hash = std::unique_ptr<QLIBSZHASH, HashDeleter>;

Hash MakeHash(const Pairs& pairs) {
    Hash hash(QLIBCSzHashAlloc(16));
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

class QlibcFileTest : public vorn::test::RootTest {
  protected:
    std::vector<std::string> Sections(const char* file) {
        QLIBSZLIST* list = nullptr;
        std::vector<std::string> names;
        if (QLIBCFileEnumSection(file, &list) >= 0) {
            for (int i = 0; i < QLIBCSzListCount(list); ++i) {
                names.push_back(QLIBCSzListGet(list, i));
            }
        }
        QLIBCSzListFree(list);
        return names;
    }
    Pairs Section(const char* file, const char* name, int* count = nullptr) {
        QLIBSZHASH* hash = nullptr;
        const int found = QLIBCFileGetSection(file, name, &hash);
        if (count != nullptr) {
            *count = found;
        }
        Pairs pairs = ToPairs(hash);
        QLIBCSzHashFree(hash);
        return pairs;
    }
    std::string Value(const char* file, const char* key, int* result = nullptr) {
        char value[64] = "junk";
        const int found = QLIBCFileGetKeyValue(file, key, value, sizeof(value), 0);
        if (result != nullptr) {
            *result = found;
        }
        return value;
    }
};

TEST_F(QlibcFileTest, SectionFilesReadByTheLineRules) {
    root_.WriteFile("/etc/s.conf",
                    "stray=ignored\r\n"
                    "# comment\r\n"
                    "[b]\r\n"
                    "\tkey=one\r\n"
                    "  other = spaced=value \r\n"
                    "; another comment\n"
                    "\n"
                    "key=two\n"
                    "[a]\n"
                    "[b]\n"
                    "third=3\r");
    EXPECT_EQ(Sections("/etc/s.conf"), (std::vector<std::string>{"b", "a"}));
    int count = 0;
    // A repeated key keeps its first place and its last value; blocks of one name merge; the
    // value is kept verbatim after the first "=".
    EXPECT_EQ(Section("/etc/s.conf", "b", &count),
              (Pairs{{"key", "two"}, {"other", " spaced=value "}, {"third", "3"}}));
    EXPECT_EQ(count, 3);
    EXPECT_TRUE(Section("/etc/s.conf", "a", &count).empty());
    EXPECT_EQ(count, 0);
    Section("/etc/s.conf", "absent", &count);
    EXPECT_EQ(count, 0);
}

TEST_F(QlibcFileTest, MalformedOrMissingFilesFailCleanly) {
    root_.WriteFile("/etc/nul.conf", std::string("[a]\nk=v\0w\n", 11));
    root_.WriteFile("/etc/long.conf", "[a]\nk=" + std::string(9000, 'x') + "\n");
    root_.WriteFile("/etc/huge.conf", std::string(1024 * 1024 + 1, '\n'));
    root_.WriteFile("/etc/empty.conf", "");
    for (const char* file : {"/etc/nul.conf", "/etc/long.conf", "/etc/huge.conf"}) {
        QLIBSZLIST* list = nullptr;
        EXPECT_EQ(QLIBCFileEnumSection(file, &list), -1) << file;
        EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_FORMAT) << file;
        QLIBCSzListFree(list);
        int result = 0;
        Value(file, "k", &result);
        EXPECT_EQ(result, -1) << file;
    }
    QLIBSZLIST* list = nullptr;
    EXPECT_EQ(QLIBCFileEnumSection("/etc/missing.conf", &list), -1);
    EXPECT_EQ(QLIBCErrGet(), QLIBC_ERR_NOT_FOUND);
    EXPECT_EQ(QLIBCFileEnumSection("/etc/empty.conf", &list), 0);
    QLIBCSzListFree(list);
}

TEST_F(QlibcFileTest, KeyFilesUnquoteAndUpdateInPlace) {
    const char* file = "/etc/vorninfo.conf";
    root_.WriteFile(file,
                    "# factory settings\n"
                    "net_topology=\"router\"\n"
                    "dns_mode=AUTO\n"
                    "empty=\"\"\n"
                    "\n"
                    "dns_mode=Auto\n");
    int result = 0;
    EXPECT_EQ(Value(file, "net_topology", &result), "router");
    EXPECT_EQ(result, 1);
    EXPECT_EQ(Value(file, "empty", &result), "");
    EXPECT_EQ(result, 1);
    EXPECT_EQ(Value(file, "absent", &result), "");
    EXPECT_EQ(result, 0);
    char small[4];
    EXPECT_EQ(QLIBCFileGetKeyValue(file, "net_topology", small, sizeof(small), 0), -1);

    EXPECT_EQ(QLIBCFileCheckKeyValue(file, "dns_mode", "auto", 0), 0);
    EXPECT_EQ(QLIBCFileCheckKeyValue(file, "dns_mode", "auto", QLIBC_FILE_IGNORE_CASE), 1);
    EXPECT_EQ(QLIBCFileCheckKeyValue("/etc/none", "dns_mode", "auto", 0), -1);

    // Quoted values stay quoted, every occurrence changes, other lines stay, new keys go last.
    ASSERT_EQ(QLIBCFileSetKeyValue(file, "net_topology", "bridge"), 0);
    ASSERT_EQ(QLIBCFileSetKeyValue(file, "dns_mode", "manual"), 0);
    ASSERT_EQ(QLIBCFileSetKeyValue(file, "added", "1"), 0);
    EXPECT_EQ(root_.ReadFile(file),
              "# factory settings\n"
              "net_topology=\"bridge\"\n"
              "dns_mode=manual\n"
              "empty=\"\"\n"
              "\n"
              "dns_mode=manual\n"
              "added=1\n");
    EXPECT_EQ(QLIBCFileSetKeyValue(file, "bad", "two\nlines"), -1);
    EXPECT_EQ(QLIBCFileSetKeyValue(file, "a=b", "x"), -1);

    Hash set = MakeHash({{"added", "2"}, {"fresh", "new value"}});
    Hash remove = MakeHash({{"empty", ""}});
    ASSERT_EQ(QLIBCFileSetKeys(file, set.get(), remove.get(), QLIBC_FILE_QUOTE_VALUES), 0);
    QLIBSZHASH* all = nullptr;
    EXPECT_EQ(QLIBCFileGetKeys(file, nullptr, &all, "="), 4);
    EXPECT_EQ(ToPairs(all), (Pairs{{"net_topology", "bridge"},
                                   {"dns_mode", "manual"},
                                   {"added", "2"},
                                   {"fresh", "new value"}}));
    QLIBCSzHashFree(all);
    EXPECT_NE(root_.ReadFile(file).find("fresh=\"new value\"\n"), std::string::npos);

    ASSERT_EQ(QLIBCFileSetKeyValue("/etc/sysconfig/network-scripts/ifcfg-new", "DEVICE", "new"), 0);
    EXPECT_EQ(root_.ReadFile("/etc/sysconfig/network-scripts/ifcfg-new"), "DEVICE=new\n");
}

TEST_F(QlibcFileTest, SectionsWriteAndReadBack) {
    Hash pairs = MakeHash({{"ifname", "eth0"}, {"gateway", " 10.0.0.1"}, {"note", "a=b #c"}});
    FILE* stream = std::fopen(root_.Path("/etc/w.conf").c_str(), "w");
    ASSERT_NE(stream, nullptr);
    ASSERT_EQ(QLIBCFileHash2File(stream, "0", pairs.get(), "\t%s=%s\n"), 0);
    // Pairs that would not read back are refused before anything is written.
    for (const Pairs& bad : {Pairs{{"k", "two\nlines"}}, Pairs{{"a=b", "v"}}, Pairs{{"#k", "v"}},
                             Pairs{{" k", "v"}}, Pairs{{"", "v"}}}) {
        EXPECT_EQ(QLIBCFileHash2File(stream, "1", MakeHash(bad).get(), "\t%s=%s\n"), -1);
    }
    EXPECT_EQ(QLIBCFileHash2File(stream, "x]", pairs.get(), "\t%s=%s\n"), -1);
    EXPECT_EQ(QLIBCFileHash2File(stream, "1", pairs.get(), "%s=%d\n"), -1);
    EXPECT_EQ(QLIBCFileHash2File(stream, "1", pairs.get(), "%s\n"), -1);
    std::fclose(stream);
    EXPECT_EQ(root_.ReadFile("/etc/w.conf"),
              "[0]\n\tifname=eth0\n\tgateway= 10.0.0.1\n\tnote=a=b #c\n");
    EXPECT_EQ(Section("/etc/w.conf", "0"), ToPairs(pairs.get()));

    // AddSection replaces a section where it stands and appends a new one.
    root_.WriteFile("/etc/r.conf", "[conf]\nold=1\n[addr]\na=1\n[conf]\nold=2\n");
    ASSERT_EQ(QLIBCFileAddSection("/etc/r.conf", "conf", MakeHash({{"k", "v"}}).get(), "\t%s=%s\n"),
              0);
    ASSERT_EQ(QLIBCFileAddSection("/etc/r.conf", "lan", MakeHash({{"p", "q"}}).get(), "\t%s=%s\n"),
              0);
    EXPECT_EQ(root_.ReadFile("/etc/r.conf"), "[conf]\n\tk=v\n[addr]\na=1\n[lan]\n\tp=q\n");
    ASSERT_EQ(QLIBCFileAddSection("/etc/new/r.conf", "conf", pairs.get(), "\t%s=%s\n"), -1);
}

TEST_F(QlibcFileTest, FileOperationsStayUnderTheRoot) {
    EXPECT_EQ(QLIBCFileExist("/etc/vorninfo.conf"), 1);
    EXPECT_EQ(QLIBCFileExist("/etc/none"), 0);
    EXPECT_EQ(QLIBCFileCheckDir("/etc", 0755), 1);
    EXPECT_EQ(QLIBCFileCheckDir("/etc/vorninfo.conf", 0755), 0);

    ASSERT_EQ(QLIBCFileTouch("/tmp/t"), 0);
    EXPECT_TRUE(root_.Exists("/tmp/t"));
    root_.WriteFile("/tmp/src", "content\n");
    chmod(root_.Path("/tmp/src").c_str(), 0600);
    ASSERT_EQ(VORNFileCopy("/tmp/src", "/tmp/dst"), 0);
    EXPECT_EQ(root_.ReadFile("/tmp/dst"), "content\n");
    struct stat info;
    ASSERT_EQ(stat(root_.Path("/tmp/dst").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777, 0600u);
    EXPECT_EQ(VORNFileCopy("/tmp/none", "/tmp/dst"), -1);

    ASSERT_EQ(QLIBCSysRename("/tmp/dst", "/tmp/moved"), 0);
    EXPECT_FALSE(root_.Exists("/tmp/dst"));
    ASSERT_EQ(QLIBCSysUnlink("/tmp/moved"), 0);
    EXPECT_FALSE(root_.Exists("/tmp/moved"));
    EXPECT_EQ(QLIBCSysUnlink("/tmp/moved"), -1);
}

}  // namespace
