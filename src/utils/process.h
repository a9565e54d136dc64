#ifndef VORN_UTILS_PROCESS_H
#define VORN_UTILS_PROCESS_H

#include <string>
#include <vector>

namespace vornwireless {
namespace utils {

// True when a live process of this host runs the program of exactly this file name ("vornnetd"
// is not "vornnetdtool"). Processes are the host's, never the simulated root's: /proc is read
// directly. An empty name or one holding '/' is never a program's.
bool IsProcessAlive(const std::string& name);
// The ids of those processes; false when /proc cannot be read. A name IsProcessAlive never
// matches finds none.
bool FindProcesses(const std::string& name, std::vector<int>& pids);

}  // namespace utils
}  // namespace vornwireless

#endif
