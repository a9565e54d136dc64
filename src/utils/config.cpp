#include "utils/config.h"

#include <libgen.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <sstream>

#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "utils/file.h"
#include "utils/log.h"
#include "utils/temp_file.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr int kHashCapacity = 1024;
constexpr size_t kPathBuffer = 1024;

std::string ToText(bool value) {
    return value ? "yes" : "no";
}

template <typename Number>
std::string ToText(Number value) {
    std::ostringstream out;
    out << value;
    return out.str();
}

int HashToMap(const QLIBSZHASH* hash, std::map<std::string, std::string>& map) {
    if (hash == nullptr) {
        VORN_LOG(LOG_ERR, "Null hash");
        return -1;
    }
    map.clear();
    for (int i = 0; i < QLIBCSzHashCount(hash); ++i) {
        const char* key = QLIBCSzHashKeyAt(hash, i);
        if (key != nullptr) {
            map[key] = QLIBCSzHashValueAt(hash, i);
        }
    }
    return 0;
}

// Owns the SDK containers of one read or write.
struct HashHolder {
    QLIBSZHASH* hash = QLIBCSzHashAlloc(kHashCapacity);
    ~HashHolder() { QLIBCSzHashFree(hash); }
};

struct ListHolder {
    QLIBSZLIST* list = QLIBCSzListAlloc(kHashCapacity);
    ~ListHolder() { QLIBCSzListFree(list); }
};

}  // namespace

std::string Config::GetDirName() const {
    char buffer[kPathBuffer] = {};
    std::strncpy(buffer, name_.c_str(), sizeof(buffer) - 1);
    return dirname(buffer);
}

int Config::MakeDirectory() const {
    const std::string dir = GetDirName();
    if (CheckAndMakeDir(dir, 0755) != 0) {
        VORN_LOG(LOG_ERR, "Failed to check and make [%s]", dir.c_str());
        return -1;
    }
    return 0;
}

int ConfigSection::Read() {
    const char* file = GetNameCString();
    if (QLIBCFileExist(file) <= 0) {
        VORN_LOG(LOG_ERR, "[%s] does not exist", file);
        return -1;
    }
    ListHolder names;
    HashHolder pairs;
    if (names.list == nullptr || pairs.hash == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to allocate memory");
        return -1;
    }
    if (QLIBCFileEnumSection(file, &names.list) < 0) {
        VORN_LOG(LOG_ERR, "Failed to enum sections in [%s]", file);
        return -1;
    }
    for (int i = 0; i < QLIBCSzListCount(names.list); ++i) {
        const char* section = QLIBCSzListGet(names.list, i);
        if (QLIBCFileGetSection(file, section, &pairs.hash) <= 0) {
            VORN_LOG(LOG_ERR, "Failed to get section [%s] in [%s]", section, file);
            return -1;
        }
        if (HashToMap(pairs.hash, sections_[section]) != 0) {
            VORN_LOG(LOG_ERR, "Failed to convert hash to map");
            return -1;
        }
        QLIBCHashRemoveAll(pairs.hash);
    }
    return 0;
}

int ConfigSection::Write() {
    if (MakeDirectory() != 0) {
        return -1;
    }
    std::string temp;
    if (WriteTemp(temp) != 0) {
        VORN_LOG(LOG_ERR, "Failed to create a temoprary file for [%s]", GetNameCString());
        return -1;
    }
    if (QLIBCSysRename(temp.c_str(), GetNameCString()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to rename file from [%s] to [%s]", temp.c_str(),
                 GetNameCString());
        return -1;
    }
    return 0;
}

int ConfigSection::WriteTemp(std::string& tempPath) const {
    TempFile temp(GetNameString());
    bool ok = temp.Created();
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to create a temporary file [%s]", temp.Logical().c_str());
        return -1;
    }
    FILE* stream = temp.Open();
    if (stream == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to open a temporary file [%s]", temp.Logical().c_str());
        ok = false;
    }
    HashHolder pairs;
    if (ok && pairs.hash == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to allocate memory");
        ok = false;
    }
    for (auto section = sections_.begin(); ok && section != sections_.end(); ++section) {
        QLIBCHashRemoveAll(pairs.hash);
        for (const auto& pair : section->second) {
            if (QLIBCSzHashSetValue(pairs.hash, pair.first.c_str(), pair.second.c_str()) != 0) {
                VORN_LOG(LOG_ERR, "Failed to set hash value[%s][%s]", pair.first.c_str(),
                         pair.second.c_str());
            }
        }
        if (QLIBCFileHash2File(stream, section->first.c_str(), pairs.hash, "\t%s=%s\n") != 0) {
            VORN_LOG(LOG_ERR, "Failed to add section [%s] in [%s]", section->first.c_str(),
                     GetNameCString());
            ok = false;
        }
    }
    // A write error (a full disk) shows only when the buffered data is flushed.
    ok = temp.Close() && ok;
    if (ok) {
        tempPath = temp.Logical();
        return 0;
    }
    if (QLIBCFileExist(temp.Logical().c_str()) > 0 && QLIBCSysUnlink(temp.Logical().c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove file [%s]", temp.Logical().c_str());
    }
    return -1;
}

int ConfigSection::DeleteSection(const std::string& section) {
    if (!Find(section)) {
        return 0;
    }
    return static_cast<int>(sections_.erase(section));
}

std::string ConfigSection::GetKeyValue(const std::string& section, const std::string& key) {
    return sections_[section][key];
}

void ConfigSection::AddKeyValue(const std::string& section, const std::string& key,
                                const std::string& value) {
    sections_[section][key] = value;
}

void ConfigSection::AddKeyValue(const std::string& section, const std::string& key,
                                const char* value) {
    AddKeyValue(section, key, std::string(value != nullptr ? value : ""));
}

void ConfigSection::AddKeyValue(const std::string& section, const std::string& key, bool value) {
    AddKeyValue(section, key, ToText(value));
}

void ConfigSection::AddKeyValue(const std::string& section, const std::string& key, double value) {
    AddKeyValue(section, key, ToText(value));
}

void ConfigSection::AddKeyValue(const std::string& section, const std::string& key, int value) {
    AddKeyValue(section, key, ToText(value));
}

int ConfigNoSection::Read() {
    const char* file = GetNameCString();
    if (QLIBCFileExist(file) <= 0) {
        VORN_LOG(LOG_ERR, "[%s] does not exist", file);
        return -1;
    }
    HashHolder pairs;
    if (pairs.hash == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to allocate memory");
        return -1;
    }
    if (QLIBCFileGetKeys(file, nullptr, &pairs.hash, "=") < 0) {
        VORN_LOG(LOG_ERR, "Failed to get keys");
        return -1;
    }
    if (HashToMap(pairs.hash, pairs_) != 0) {
        VORN_LOG(LOG_ERR, "Failed to convert hash to map");
        return -1;
    }
    return 0;
}

int ConfigNoSection::Write() {
    if (MakeDirectory() != 0) {
        return -1;
    }
    // The pairs alone, replacing the file whole: a writer killed half-way leaves the previous
    // file, never a torn or missing one.
    std::string text;
    std::string line;
    for (const auto& pair : pairs_) {
        if (!vorn::platform::IsWritableKey(pair.first) ||
            !vorn::platform::IsWritableValue(pair.second) ||
            !vorn::platform::FormatPair("%s=%s\n", pair.first.c_str(), pair.second.c_str(), line)) {
            VORN_LOG(LOG_ERR, "Failed to set keys");
            return -1;
        }
        text += line;
    }
    if (!vorn::platform::WriteFileAtomically(vorn::platform::RootPath(GetNameString()), text)) {
        VORN_LOG(LOG_ERR, "Failed to write [%s]", GetNameCString());
        return -1;
    }
    return 0;
}

void ConfigNoSection::AddKeyValue(const std::string& key, const std::string& value) {
    pairs_[key] = value;
}

void ConfigNoSection::AddKeyValue(const std::string& key, const char* value) {
    AddKeyValue(key, std::string(value != nullptr ? value : ""));
}

void ConfigNoSection::AddKeyValue(const std::string& key, bool value) {
    AddKeyValue(key, ToText(value));
}

void ConfigNoSection::AddKeyValue(const std::string& key, double value) {
    AddKeyValue(key, ToText(value));
}

void ConfigNoSection::AddKeyValue(const std::string& key, int value) {
    AddKeyValue(key, ToText(value));
}

}  // namespace utils
}  // namespace vornwireless
