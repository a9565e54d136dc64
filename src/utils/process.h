#ifndef VORN_UTILS_PROCESS_H
#define VORN_UTILS_PROCESS_H

#include <string>

namespace vornwireless {
namespace utils {

// True when a live process of this host runs the program of exactly this file name ("vornnetd"
// is not "vornnetdtool"). Processes are the host's, never the simulated root's: /proc is read
// directly. An empty name or one holding '/' is never a program's.
bool IsProcessAlive(const std::string& name);

}  // namespace utils
}  // namespace vornwireless

#endif
