#include "utils/reset_files.h"

#include <glob.h>
#include <libgen.h>
#include <unistd.h>

#include <climits>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <vector>

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr std::size_t kLineBytes = 1024;
constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN;

// How many entries the shell lists for path, which may be a pattern; -1 when it cannot tell.
int CountMatches(const char* path) {
    char command[kLineBytes];
    const int length =
        std::snprintf(command, sizeof(command), "/bin/ls %s 2>/dev/null | /usr/bin/wc -l",
                      vorn::platform::ShellRootPath(path).c_str());
    if (length < 0 || static_cast<std::size_t>(length) >= sizeof(command)) {
        return -1;
    }
    std::string line;
    if (vorn::platform::ReadShellCommandLine(command, line, kLineBytes) != 0) {
        return -1;
    }
    char* end = nullptr;
    const long count = std::strtol(line.c_str(), &end, 10);
    if (end == line.c_str() || count < 0) {
        return -1;
    }
    return count > INT_MAX ? INT_MAX : static_cast<int>(count);
}

// The real paths a logical path or pattern names. Programs run without a shell, so patterns such
// as "/usr/vorn/etc/wifi/wifi_ap_*" are expanded here.
std::vector<std::string> Expand(const char* path) {
    std::vector<std::string> matches;
    glob_t found;
    if (glob(vorn::platform::RootPath(path).c_str(), 0, nullptr, &found) == 0) {
        matches.assign(found.gl_pathv, found.gl_pathv + found.gl_pathc);
    }
    globfree(&found);
    return matches;
}

bool RemoveTree(const char* path) {
    bool removed = true;
    for (const auto& match : Expand(path)) {
        removed = QLIBCExecl("/bin/rm", kExecFlags, "-rf", match.c_str(),
                             static_cast<const char*>(nullptr)) == 0 &&
                  removed;
    }
    return removed;
}

bool CopyInto(const char* src, const std::string& directory) {
    const std::string target = vorn::platform::RootPath(directory);
    bool copied = true;
    for (const auto& match : Expand(src)) {
        copied = QLIBCExecl("/bin/cp", kExecFlags, "-rf", match.c_str(), target.c_str(),
                            static_cast<const char*>(nullptr)) == 0 &&
                 copied;
    }
    return copied;
}

std::string DirectoryOf(const char* path) {
    std::vector<char> copy(path, path + std::char_traits<char>::length(path) + 1);
    return dirname(copy.data());
}

}  // namespace

void ResetFiles(const char* src, const char* dst) {
    if (src == nullptr || dst == nullptr) {
        return;
    }
    if (CountMatches(dst) > 0 && !RemoveTree(dst)) {
        VORN_LOG(LOG_ERR, "Failed to remove [%s]", dst);
    }
    if (CountMatches(src) > 0 && !CopyInto(src, DirectoryOf(dst))) {
        VORN_LOG(LOG_ERR, "Failed to copy [%s] to [%s]", src, dst);
    }
}

void RemoveFiles(const char* path) {
    if (path != nullptr && CountMatches(path) > 0 && !RemoveTree(path)) {
        VORN_LOG(LOG_ERR, "Failed to remove [%s]", path);
    }
}

void RemoveFile(const char* path) {
    if (path != nullptr) {
        unlink(vorn::platform::RootPath(path).c_str());
    }
}

bool SetProcEntry(const std::string& path, const std::string& value) {
    std::fstream entry(vorn::platform::RootPath(path), std::ios::in | std::ios::out);
    if (!entry.is_open()) {
        return false;
    }
    entry << value << '\n';
    return true;
}

}  // namespace utils
}  // namespace vornwireless
