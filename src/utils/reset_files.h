#ifndef VORN_UTILS_RESET_FILES_H
#define VORN_UTILS_RESET_FILES_H

#include <string>

namespace vornwireless {
namespace utils {

// Replaces dst with a copy of src: dst is removed when it exists, then src is copied into the
// directory of dst (so both should share a base name).
void ResetFiles(const char* src, const char* dst);
// Removes path recursively when it names at least one entry.
void RemoveFiles(const char* path);
void RemoveFile(const char* path);
// Writes value and a line end into an existing file such as a /proc/sys/net switch; false when
// it cannot be opened.
bool SetProcEntry(const std::string& path, const std::string& value);

}  // namespace utils
}  // namespace vornwireless

#endif
