#ifndef VORN_UTILS_CREATE_PID_FILE_H
#define VORN_UTILS_CREATE_PID_FILE_H

#include <string>

namespace vornwireless {
namespace utils {

// Locks path and writes this process's id into it. Returns the descriptor, which must stay open
// for the lock to hold, or -1; -1 without a log line when another process holds the lock.
int CreatePidFile(const std::string& path);

}  // namespace utils
}  // namespace vornwireless

#endif
