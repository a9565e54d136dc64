#include "platform/qlibc_file.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "platform/qlibc_error.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "utils/log.h"

namespace {

using vorn::platform::RootPath;
using Pairs = std::vector<std::pair<std::string, std::string>>;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

// A file that does not exist yet reads as empty, for the calls that create it.
bool ReadOrEmpty(const std::string& real, std::string& text) {
    if (vorn::platform::ReadTextFile(real, text)) {
        return true;
    }
    text.clear();
    return QLIBCErrGet() == QLIBC_ERR_NOT_FOUND;
}

template <typename Container, typename Alloc>
Container* Ensure(Container** container, Alloc alloc) {
    if (*container == nullptr) {
        *container = alloc(1024);
    }
    return *container;
}

Pairs HashPairs(const QLIBSZHASH* hash) {
    Pairs pairs;
    for (int i = 0; i < QLIBCSzHashCount(hash); ++i) {
        pairs.emplace_back(QLIBCSzHashKeyAt(hash, i), QLIBCSzHashValueAt(hash, i));
    }
    return pairs;
}

bool ArePairsWritable(const Pairs& pairs) {
    for (const auto& pair : pairs) {
        if (!vorn::platform::IsWritableKey(pair.first) ||
            !vorn::platform::IsWritableValue(pair.second)) {
            return false;
        }
    }
    return true;
}

bool FormatSection(const char* section, const Pairs& pairs, const char* format, std::string& out) {
    if (section != nullptr && !vorn::platform::IsWritableSectionName(section)) {
        return false;
    }
    if (!ArePairsWritable(pairs)) {
        return false;
    }
    out = section != nullptr ? std::string("[") + section + "]\n" : "";
    std::string line;
    for (const auto& pair : pairs) {
        if (!vorn::platform::FormatPair(format, pair.first.c_str(), pair.second.c_str(), line)) {
            return false;
        }
        out += line;
    }
    // A probe pair checks the format even when the section has no pairs.
    return vorn::platform::FormatPair(format, "k", "v", line);
}

std::string KeyLine(const std::string& key, const std::string& value, bool quoted) {
    return quoted ? key + "=\"" + value + "\"" : key + "=" + value;
}

// Sets and removes keys of a key=value file; every other line stays as it was.
int UpdateKeyFile(const char* file, const Pairs& set, const std::set<std::string>& remove,
                  bool quoteNew) {
    if (file == nullptr || !ArePairsWritable(set)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string real = RootPath(file);
    std::string text;
    if (!ReadOrEmpty(real, text)) {
        return -1;
    }
    std::string out;
    std::set<std::string> written;
    std::string key;
    std::string value;
    for (const auto& line : vorn::platform::SplitLines(text)) {
        if (!vorn::platform::ParseKeyLine(line, "=", false, key, value)) {
            out += line + "\n";
            continue;
        }
        if (remove.count(key) != 0) {
            continue;
        }
        auto replacement = set.end();
        for (auto it = set.begin(); it != set.end(); ++it) {
            if (it->first == key) {
                replacement = it;
            }
        }
        if (replacement == set.end()) {
            out += line + "\n";
            continue;
        }
        const bool quoted = value.size() >= 2 && value.front() == '"' && value.back() == '"';
        out += KeyLine(key, replacement->second, quoted) + "\n";
        written.insert(key);
    }
    for (const auto& pair : set) {
        if (written.insert(pair.first).second) {
            out += KeyLine(pair.first, pair.second, quoteNew) + "\n";
        }
    }
    return vorn::platform::WriteFileAtomically(real, out) ? 0 : -1;
}

}  // namespace

extern "C" {

int QLIBCFileExist(const char* path) {
    if (path == nullptr) {
        return 0;
    }
    struct stat info;
    return stat(RootPath(path).c_str(), &info) == 0 ? 1 : 0;
}

int QLIBCFileCheckDir(const char* dir, unsigned int mode) {
    (void)mode;
    if (dir == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string real = RootPath(dir);
    struct stat info;
    return (stat(real.c_str(), &info) == 0 && S_ISDIR(info.st_mode) &&
            access(real.c_str(), X_OK) == 0)
               ? 1
               : 0;
}

int QLIBCFileTouch(const char* path) {
    if (path == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string real = RootPath(path);
    const int fd = open(real.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0644);
    if (fd < 0) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    const bool touched = futimens(fd, nullptr) == 0;
    close(fd);
    return touched ? 0 : Fail(QLIBC_ERR_FILE_IO);
}

int QLIBCFileGetKeyValue(const char* file, const char* key, char* value, int size, int flags) {
    (void)flags;
    if (file == nullptr || key == nullptr || value == nullptr || size <= 0) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    value[0] = '\0';
    QLIBSZLIST* filter = QLIBCSzListAlloc(1);
    QLIBSZHASH* hash = nullptr;
    int result = -1;
    if (filter != nullptr && QLIBCSzListAdd(filter, key) == 0) {
        result = QLIBCFileGetKeys(file, filter, &hash, "=");
    }
    if (result > 0) {
        const char* found = QLIBCSzHashGetValue(hash, key);
        if (std::strlen(found) >= static_cast<size_t>(size)) {
            result = Fail(QLIBC_ERR_FORMAT);
        } else {
            std::strcpy(value, found);
            result = 1;
        }
    }
    QLIBCSzHashFree(hash);
    QLIBCSzListFree(filter);
    return result;
}

int QLIBCFileSetKeyValue(const char* file, const char* key, const char* value) {
    if (key == nullptr || value == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return UpdateKeyFile(file, {{key, value}}, {}, false);
}

int QLIBCFileCheckKeyValue(const char* file, const char* key, const char* value, int flags) {
    if (value == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    char stored[4096];
    const int found = QLIBCFileGetKeyValue(file, key, stored, sizeof(stored), 0);
    if (found <= 0) {
        return found;
    }
    const bool equal = (flags & QLIBC_FILE_IGNORE_CASE) ? strcasecmp(stored, value) == 0
                                                        : std::strcmp(stored, value) == 0;
    return equal ? 1 : 0;
}

int QLIBCFileGetKeys(const char* file, const QLIBSZLIST* keys, QLIBSZHASH** hash,
                     const char* separator) {
    if (file == nullptr || hash == nullptr || separator == nullptr || separator[0] == '\0') {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::string text;
    if (!vorn::platform::ReadTextFile(RootPath(file), text)) {
        return -1;
    }
    if (Ensure(hash, QLIBCSzHashAlloc) == nullptr) {
        return -1;
    }
    return vorn::platform::ReadKeys(text, separator, keys, *hash);
}

int QLIBCFileSetKeys(const char* file, const QLIBSZHASH* set, const QLIBSZHASH* remove, int flags) {
    std::set<std::string> removed;
    for (const auto& pair : HashPairs(remove)) {
        removed.insert(pair.first);
    }
    return UpdateKeyFile(file, HashPairs(set), removed, (flags & QLIBC_FILE_QUOTE_VALUES) != 0);
}

int QLIBCFileEnumSection(const char* file, QLIBSZLIST** list) {
    if (file == nullptr || list == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::string text;
    if (!vorn::platform::ReadTextFile(RootPath(file), text)) {
        return -1;
    }
    if (Ensure(list, QLIBCSzListAlloc) == nullptr) {
        return -1;
    }
    const std::vector<std::string> names = vorn::platform::SectionNames(text);
    for (const auto& name : names) {
        if (QLIBCSzListAdd(*list, name.c_str()) != 0) {
            return -1;
        }
    }
    return static_cast<int>(names.size());
}

int QLIBCFileEnumDir(const char* dir, const char* prefix, int max, QLIBSZLIST** names) {
    if (dir == nullptr || names == nullptr || max < 0) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string start = prefix == nullptr ? "" : prefix;
    const std::unique_ptr<DIR, int (*)(DIR*)> stream(opendir(RootPath(dir).c_str()), &closedir);
    if (!stream) {
        VORN_LOG(LOG_ERR, "Failed to read directory [%s] errno [%d]", dir, errno);
        return Fail(errno == ENOENT ? QLIBC_ERR_NOT_FOUND : QLIBC_ERR_FILE_IO);
    }
    std::vector<std::string> found;
    while (const dirent* entry = readdir(stream.get())) {
        const std::string name = entry->d_name;
        if (name != "." && name != ".." && name.compare(0, start.size(), start) == 0) {
            found.push_back(name);
        }
    }
    std::sort(found.begin(), found.end());
    if (found.size() > static_cast<size_t>(max)) {
        VORN_LOG(LOG_WARNING, "Directory [%s] has %zu entries [%s*], kept %d", dir, found.size(),
                 start.c_str(), max);
        found.resize(static_cast<size_t>(max));
    }
    if (Ensure(names, QLIBCSzListAlloc) == nullptr) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
    for (const auto& name : found) {
        if (QLIBCSzListAdd(*names, name.c_str()) != 0) {
            return Fail(QLIBC_ERR_NO_MEMORY);
        }
    }
    return static_cast<int>(found.size());
}

int QLIBCFileGetSection(const char* file, const char* section, QLIBSZHASH** hash) {
    if (file == nullptr || section == nullptr || hash == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::string text;
    if (!vorn::platform::ReadTextFile(RootPath(file), text)) {
        return -1;
    }
    if (Ensure(hash, QLIBCSzHashAlloc) == nullptr) {
        return -1;
    }
    return vorn::platform::ReadSection(text, section, *hash);
}

int QLIBCFileAddSection(const char* file, const char* section, const QLIBSZHASH* hash,
                        const char* format) {
    std::string block;
    if (file == nullptr || section == nullptr ||
        !FormatSection(section, HashPairs(hash), format, block)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string real = RootPath(file);
    std::string text;
    if (!ReadOrEmpty(real, text)) {
        return -1;
    }
    std::string out;
    bool replaced = false;
    bool skipping = false;
    std::string name;
    for (const auto& line : vorn::platform::SplitLines(text)) {
        if (vorn::platform::ParseSectionHeader(line, name)) {
            skipping = name == section;
            if (skipping && !replaced) {
                out += block;
                replaced = true;
            }
        }
        if (!skipping) {
            out += line + "\n";
        }
    }
    if (!replaced) {
        out += block;
    }
    return vorn::platform::WriteFileAtomically(real, out) ? 0 : -1;
}

int QLIBCFileHash2File(FILE* stream, const char* section, const QLIBSZHASH* hash,
                       const char* format) {
    std::string block;
    if (stream == nullptr || !FormatSection(section, HashPairs(hash), format, block)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    if (std::fwrite(block.data(), 1, block.size(), stream) != block.size()) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    return 0;
}

int QLIBCSysRename(const char* from, const char* to) {
    if (from == nullptr || to == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return rename(RootPath(from).c_str(), RootPath(to).c_str()) == 0 ? 0 : Fail(QLIBC_ERR_FILE_IO);
}

int QLIBCSysUnlink(const char* path) {
    if (path == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return unlink(RootPath(path).c_str()) == 0 ? 0 : Fail(QLIBC_ERR_FILE_IO);
}

int VORNFileCopy(const char* src, const char* dst) {
    if (src == nullptr || dst == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const int in = open(RootPath(src).c_str(), O_RDONLY | O_CLOEXEC);
    if (in < 0) {
        return Fail(errno == ENOENT ? QLIBC_ERR_NOT_FOUND : QLIBC_ERR_FILE_IO);
    }
    std::string content;
    char buffer[65536];
    ssize_t got = 0;
    while ((got = read(in, buffer, sizeof(buffer))) != 0) {
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got < 0) {
            close(in);
            return Fail(QLIBC_ERR_FILE_IO);
        }
        content.append(buffer, static_cast<size_t>(got));
    }
    struct stat info;
    const bool haveMode = fstat(in, &info) == 0;
    close(in);
    const std::string real = RootPath(dst);
    if (!vorn::platform::WriteFileAtomically(real, content)) {
        return -1;
    }
    if (haveMode) {
        chmod(real.c_str(), info.st_mode & 07777);
    }
    return 0;
}

}  // extern "C"
