#ifndef VORN_PLATFORM_SHELL_COMMAND_H
#define VORN_PLATFORM_SHELL_COMMAND_H

#include <cstddef>
#include <string>

namespace vorn {
namespace platform {

// Runs a shell command line through popen, its absolute programs resolved under the root, and
// reads the first output line as fgets into a buffer of maxBytes would (line end kept). The rest
// of the output is discarded. 0, or -1 when the command could not be started.
int ReadShellCommandLine(const std::string& commandLine, std::string& line,
                         std::size_t maxBytes = 1024);

}  // namespace platform
}  // namespace vorn

#endif
