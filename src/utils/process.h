#ifndef VORN_UTILS_PROCESS_H
#define VORN_UTILS_PROCESS_H

#include <string>

namespace vornwireless {
namespace utils {

// True when the process list shows a process whose line holds name. A name that cannot sit
// inside single quotes in a shell line (empty, a quote, a backslash, a control character) is
// refused with false.
bool IsProcessAlive(const std::string& name);

}  // namespace utils
}  // namespace vornwireless

#endif
