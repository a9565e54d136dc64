#include "utils/reset_files.h"

#include <glob.h>
#include <libgen.h>
#include <unistd.h>

#include <fstream>
#include <vector>

#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr int kExecFlags = QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN;

// The real paths a logical path or pattern names; none, nothing is run. Programs run without a
// shell, so patterns such as "/usr/vorn/etc/wifi/wifi_ap_*" are expanded here.
std::vector<std::string> Expand(const char* path) {
    std::vector<std::string> matches;
    glob_t found;
    if (glob(vorn::platform::RootPath(path).c_str(), 0, nullptr, &found) == 0) {
        matches.assign(found.gl_pathv, found.gl_pathv + found.gl_pathc);
    }
    globfree(&found);
    return matches;
}

bool RemoveAll(const std::vector<std::string>& matches) {
    bool removed = true;
    for (const auto& match : matches) {
        removed = QLIBCExecl("/bin/rm", kExecFlags, "-rf", match.c_str(),
                             static_cast<const char*>(nullptr)) == 0 &&
                  removed;
    }
    return removed;
}

bool CopyAll(const std::vector<std::string>& matches, const std::string& directory) {
    const std::string target = vorn::platform::RootPath(directory);
    bool copied = true;
    for (const auto& match : matches) {
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
    if (!RemoveAll(Expand(dst))) {
        VORN_LOG(LOG_ERR, "Failed to remove [%s]", dst);
    }
    if (!CopyAll(Expand(src), DirectoryOf(dst))) {
        VORN_LOG(LOG_ERR, "Failed to copy [%s] to [%s]", src, dst);
    }
}

void RemoveFiles(const char* path) {
    if (path != nullptr && !RemoveAll(Expand(path))) {
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
