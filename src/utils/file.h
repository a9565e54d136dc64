#ifndef VORN_UTILS_FILE_H
#define VORN_UTILS_FILE_H

#include <string>

namespace vornwireless {
namespace utils {

// 0 when dir exists or was created (always with mode 0755; mode is only checked and logged).
int CheckAndMakeDir(const std::string& dir, unsigned int mode);

// Copies the IPv6 keys of one interface's ifcfg file into another's; keys the source lacks are
// left alone in the target. 0 or -1.
int CopyIfcfgIPv6Attrs(const std::string& from, const std::string& to);

}  // namespace utils
}  // namespace vornwireless

#endif
