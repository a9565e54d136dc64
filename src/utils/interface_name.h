#ifndef VORN_UTILS_INTERFACE_NAME_H
#define VORN_UTILS_INTERFACE_NAME_H

#include <string>

namespace vornwireless {
namespace utils {

// Whether a name from outside (a request, a file, the kernel) may name an interface on a command
// line or in a path: 1 to 15 characters from letters, digits and "-_.:@+", and not "." or "..".
bool IsValidInterfaceName(const std::string& name);
// The same, with a log line naming a refused name: the kernel allows "$", "`", ";" and "%" in
// names, which must reach no command line.
bool CheckInterfaceName(const std::string& name);

}  // namespace utils
}  // namespace vornwireless

#endif
