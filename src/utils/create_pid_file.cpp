#include "utils/create_pid_file.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "platform/root_path.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

enum class LockResult { kLocked, kHeldElsewhere, kFailed };

LockResult LockWholeFile(int fd) {
    struct flock lock = {};
    lock.l_type = F_WRLCK;
    lock.l_whence = SEEK_SET;
    lock.l_start = 0;
    lock.l_len = 0;
    if (fcntl(fd, F_SETLK, &lock) == 0) {
        return LockResult::kLocked;
    }
    return errno == EAGAIN || errno == EACCES ? LockResult::kHeldElsewhere : LockResult::kFailed;
}

bool WriteAll(int fd, const std::string& text) {
    return write(fd, text.data(), text.size()) == static_cast<ssize_t>(text.size());
}

}  // namespace

int CreatePidFile(const std::string& path) {
    const int fd = open(vorn::platform::RootPath(path).c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    if (fd < 0) {
        VORN_LOG(LOG_ERR, "Could not open PID file [%s]", path.c_str());
        return -1;
    }
    switch (LockWholeFile(fd)) {
        case LockResult::kLocked:
            break;
        case LockResult::kHeldElsewhere:
            close(fd);
            return -1;
        case LockResult::kFailed:
            VORN_LOG(LOG_ERR, "Unable to lock PID file [%s]", path.c_str());
            close(fd);
            return -1;
    }
    if (ftruncate(fd, 0) != 0) {
        VORN_LOG(LOG_ERR, "Could not truncate PID file [%s]", path.c_str());
        close(fd);
        return -1;
    }
    if (!WriteAll(fd, std::to_string(getpid()) + "\n")) {
        VORN_LOG(LOG_ERR, "Writing to PID file [%s]", path.c_str());
        close(fd);
        return -1;
    }
    return fd;
}

}  // namespace utils
}  // namespace vornwireless
