#ifndef VORN_PLATFORM_SHELL_COMMAND_H
#define VORN_PLATFORM_SHELL_COMMAND_H

#include <cstddef>
#include <string>
#include <vector>

namespace vorn {
namespace platform {

// Runs a shell command line through popen, its absolute programs resolved under the root, and
// reads the first output line as fgets into a buffer of maxBytes would (line end kept). The rest
// of the output is discarded. 0, or -1 when the command could not be started.
int ReadShellCommandLine(const std::string& commandLine, std::string& line,
                         std::size_t maxBytes = 1024);

// Like ReadShellCommandLine, but keeps up to maxLines whole output lines (line ends removed);
// a line longer than maxBytes is dropped, not split; output beyond maxLines is logged and dropped. 0, or -1 when the command could not be
// started. succeeded, when given, tells whether the command exited with 0 (or was cut off at
// maxLines, which may end it by a broken pipe).
int ReadShellCommandLines(const std::string& commandLine, std::vector<std::string>& lines,
                          std::size_t maxLines = 1024, std::size_t maxBytes = 1024,
                          bool* succeeded = nullptr);

}  // namespace platform
}  // namespace vorn

#endif
