#ifndef VORN_PLATFORM_SHELL_COMMAND_H
#define VORN_PLATFORM_SHELL_COMMAND_H

#include <sys/types.h>

#include <chrono>
#include <cstddef>
#include <string>
#include <vector>

namespace vorn {
namespace platform {

using Deadline = std::chrono::steady_clock::time_point;

// The bound on every program the platform runs and waits for: 60 s unless changed; a value of 0
// or less restores it. Process-wide.
void SetProgramTimeout(int milliseconds);
int ProgramTimeout();
// Now plus the bound.
Deadline ProgramDeadline();

// Waits for pid, started as the leader of a process group of its own, until the deadline. Past
// it the whole group is killed with SIGKILL, the kill is logged naming the program, and the call
// gives false. True when the program ended; status is its wait status.
bool WaitUntil(pid_t pid, const std::string& program, Deadline deadline, int& status);

// Runs a shell command line through /bin/sh, its absolute programs resolved under the root, and
// reads the first output line as fgets into a buffer of maxBytes would (line end kept). The rest
// of the output is discarded. 0, or -1 when the command could not be started or was killed at
// the deadline.
int ReadShellCommandLine(const std::string& commandLine, std::string& line,
                         std::size_t maxBytes = 1024);

// Like ReadShellCommandLine, but keeps up to maxLines whole output lines (line ends removed);
// a line longer than maxBytes is dropped, not split; output beyond maxLines is logged and
// dropped. 0, or -1 when the command could not be started or was killed at the deadline.
// succeeded, when given, tells whether the command exited with 0 (or was cut off at maxLines,
// which may end it by a broken pipe).
int ReadShellCommandLines(const std::string& commandLine, std::vector<std::string>& lines,
                          std::size_t maxLines = 1024, std::size_t maxBytes = 1024,
                          bool* succeeded = nullptr);

}  // namespace platform
}  // namespace vorn

#endif
