#include "utils/temp_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>

#include "platform/root_path.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr size_t kPathBuffer = 1024;
constexpr const char* kTempSuffix = ".tmp.XXXXXX";

}  // namespace

TempFile::TempFile(const std::string& logicalName) {
    char logical[kPathBuffer] = {};
    std::snprintf(logical, sizeof(logical), "%s%s", logicalName.c_str(), kTempSuffix);
    logical_ = logical;
    std::string real = vorn::platform::RootPath(logical_);
    fd_ = mkstemp(&real[0]);
    if (fd_ >= 0) {
        // mkstemp makes the file 0600; the replacement keeps the mode of the file it replaces.
        struct stat existing;
        const bool exists = stat(vorn::platform::RootPath(logicalName).c_str(), &existing) == 0;
        fchmod(fd_, exists ? (existing.st_mode & 07777) : 0644);
        fcntl(fd_, F_SETFD, FD_CLOEXEC);
        // mkstemp filled in the last six characters of the real name; the logical name has the
        // same ending.
        logical_.replace(logical_.size() - 6, 6, real.substr(real.size() - 6));
    }
}

FILE* TempFile::Open() {
    stream_ = fdopen(fd_, "w");
    return stream_;
}

bool TempFile::Close() {
    bool ok = true;
    if (stream_ != nullptr) {
        ok = std::fflush(stream_) == 0 && fsync(fileno(stream_)) == 0;
        ok = std::fclose(stream_) == 0 && ok;
        stream_ = nullptr;
        fd_ = -1;
    } else if (fd_ >= 0) {
        close(fd_);
        fd_ = -1;
    }
    return ok;
}

}  // namespace utils
}  // namespace vornwireless
