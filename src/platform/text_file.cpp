#include "platform/text_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <set>

#include "platform/qlibc_error.h"

namespace vorn {
namespace platform {
namespace {

constexpr const char* kBlanks = " \t";

std::string TrimBlanks(const std::string& text) {
    const size_t begin = text.find_first_not_of(kBlanks);
    if (begin == std::string::npos) {
        return "";
    }
    const size_t end = text.find_last_not_of(kBlanks);
    return text.substr(begin, end - begin + 1);
}

bool IsCommentOrBlank(const std::string& line, size_t start) {
    return start == std::string::npos || line[start] == '#' || line[start] == ';';
}

bool HasLineEnd(const std::string& text) {
    return text.find_first_of("\r\n") != std::string::npos;
}

bool WriteAll(int fd, const std::string& content) {
    size_t done = 0;
    while (done < content.size()) {
        const ssize_t written = write(fd, content.data() + done, content.size() - done);
        if (written < 0) {
            if (errno == EINTR) {
                continue;
            }
            return false;
        }
        done += static_cast<size_t>(written);
    }
    return true;
}

}  // namespace

bool IsBoundedText(const std::string& text) {
    if (text.size() > kMaxTextFileSize || text.find('\0') != std::string::npos) {
        return false;
    }
    size_t lineStart = 0;
    for (size_t i = 0; i <= text.size(); ++i) {
        if (i == text.size() || text[i] == '\n' || text[i] == '\r') {
            if (i - lineStart > kMaxLineLength) {
                return false;
            }
            lineStart = i + 1;
        }
    }
    return true;
}

bool ReadTextFile(const std::string& realPath, std::string& text) {
    const int fd = open(realPath.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0) {
        QLIBCErrSet(errno == ENOENT ? QLIBC_ERR_NOT_FOUND : QLIBC_ERR_FILE_IO);
        return false;
    }
    text.clear();
    char buffer[16384];
    bool ok = true;
    for (;;) {
        const ssize_t got = read(fd, buffer, sizeof(buffer));
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got < 0) {
            QLIBCErrSet(QLIBC_ERR_FILE_IO);
            ok = false;
            break;
        }
        if (got == 0) {
            break;
        }
        if (text.size() + static_cast<size_t>(got) > kMaxTextFileSize) {
            QLIBCErrSet(QLIBC_ERR_FORMAT);
            ok = false;
            break;
        }
        text.append(buffer, static_cast<size_t>(got));
    }
    close(fd);
    if (ok && !IsBoundedText(text)) {
        QLIBCErrSet(QLIBC_ERR_FORMAT);
        ok = false;
    }
    return ok;
}

std::vector<std::string> SplitLines(const std::string& text) {
    std::vector<std::string> lines;
    size_t start = 0;
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '\n' && text[i] != '\r') {
            continue;
        }
        lines.push_back(text.substr(start, i - start));
        if (text[i] == '\r' && i + 1 < text.size() && text[i + 1] == '\n') {
            ++i;
        }
        start = i + 1;
    }
    if (start < text.size()) {
        lines.push_back(text.substr(start));
    }
    return lines;
}

bool ParseKeyLine(const std::string& line, const std::string& separator, bool unquote,
                  std::string& key, std::string& value) {
    const size_t start = line.find_first_not_of(kBlanks);
    if (IsCommentOrBlank(line, start) || line[start] == '[' || separator.empty()) {
        return false;
    }
    const size_t split = line.find(separator, start);
    if (split == std::string::npos) {
        return false;
    }
    key = TrimBlanks(line.substr(start, split - start));
    if (key.empty()) {
        return false;
    }
    value = line.substr(split + separator.size());
    if (unquote && value.size() >= 2 && value.front() == '"' && value.back() == '"') {
        value = value.substr(1, value.size() - 2);
    }
    return true;
}

bool ParseSectionHeader(const std::string& line, std::string& name) {
    const size_t start = line.find_first_not_of(kBlanks);
    if (start == std::string::npos || line[start] != '[') {
        return false;
    }
    const size_t end = line.find(']', start + 1);
    if (end == std::string::npos) {
        return false;
    }
    name = line.substr(start + 1, end - start - 1);
    return true;
}

std::vector<std::string> SectionNames(const std::string& text) {
    std::vector<std::string> names;
    std::set<std::string> seen;
    std::string name;
    for (const auto& line : SplitLines(text)) {
        if (ParseSectionHeader(line, name) && seen.insert(name).second) {
            names.push_back(name);
        }
    }
    return names;
}

int ReadSection(const std::string& text, const std::string& name, QLIBSZHASH* hash) {
    std::set<std::string> keys;
    bool inside = false;
    std::string header;
    std::string key;
    std::string value;
    for (const auto& line : SplitLines(text)) {
        if (ParseSectionHeader(line, header)) {
            inside = header == name;
        } else if (inside && ParseKeyLine(line, "=", false, key, value)) {
            if (QLIBCSzHashSetValue(hash, key.c_str(), value.c_str()) != 0) {
                return -1;
            }
            keys.insert(key);
        }
    }
    return static_cast<int>(keys.size());
}

int ReadKeys(const std::string& text, const std::string& separator, const QLIBSZLIST* filter,
             QLIBSZHASH* hash) {
    std::set<std::string> wanted;
    for (int i = 0; filter != nullptr && i < QLIBCSzListCount(filter); ++i) {
        wanted.insert(QLIBCSzListGet(filter, i));
    }
    std::set<std::string> keys;
    std::string key;
    std::string value;
    for (const auto& line : SplitLines(text)) {
        if (!ParseKeyLine(line, separator, true, key, value)) {
            continue;
        }
        if (filter != nullptr && wanted.count(key) == 0) {
            continue;
        }
        if (QLIBCSzHashSetValue(hash, key.c_str(), value.c_str()) != 0) {
            return -1;
        }
        keys.insert(key);
    }
    return static_cast<int>(keys.size());
}

bool FormatPair(const char* format, const char* key, const char* value, std::string& out) {
    if (format == nullptr || key == nullptr || value == nullptr) {
        return false;
    }
    out.clear();
    int strings = 0;
    for (const char* p = format; *p != '\0'; ++p) {
        if (*p != '%') {
            out += *p;
        } else if (p[1] == '%') {
            out += '%';
            ++p;
        } else if (p[1] == 's' && strings < 2) {
            out += strings++ == 0 ? key : value;
            ++p;
        } else {
            return false;
        }
    }
    return strings == 2;
}

bool IsWritableKey(const std::string& key) {
    return !key.empty() && key == TrimBlanks(key) && key.find('=') == std::string::npos &&
           !HasLineEnd(key) && key[0] != '#' && key[0] != ';' && key[0] != '[';
}

bool IsWritableValue(const std::string& value) {
    return !HasLineEnd(value);
}

bool IsWritableSectionName(const std::string& name) {
    return name.find(']') == std::string::npos && !HasLineEnd(name);
}

bool WriteFileAtomically(const std::string& realPath, const std::string& content) {
    std::string temp = realPath + ".tmp.XXXXXX";
    const int fd = mkstemp(&temp[0]);
    if (fd < 0) {
        QLIBCErrSet(QLIBC_ERR_FILE_IO);
        return false;
    }
    fcntl(fd, F_SETFD, FD_CLOEXEC);
    struct stat existing;
    const mode_t mode = stat(realPath.c_str(), &existing) == 0 ? (existing.st_mode & 07777) : 0644;
    const bool written = WriteAll(fd, content) && fchmod(fd, mode) == 0 && fsync(fd) == 0;
    const bool closed = close(fd) == 0;
    if (!written || !closed || rename(temp.c_str(), realPath.c_str()) != 0) {
        unlink(temp.c_str());
        QLIBCErrSet(QLIBC_ERR_FILE_IO);
        return false;
    }
    return true;
}

}  // namespace platform
}  // namespace vorn
