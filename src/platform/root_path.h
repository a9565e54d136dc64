#ifndef VORN_PLATFORM_ROOT_PATH_H
#define VORN_PLATFORM_ROOT_PATH_H

#include <string>

namespace vorn {
namespace platform {

// The directory every absolute path lives under: $VORN_ROOT without trailing slashes, or "" when
// it is unset, empty or "/" (the appliance itself).
std::string Root();

// The real path of a logical absolute path ("/etc/x" -> "$VORN_ROOT/etc/x"). Relative paths are
// returned unchanged.
std::string RootPath(const std::string& path);

// The rooted path for a shell command line: the root part is shell-quoted when it needs to be,
// the logical part is left as it is so that patterns such as "wifi_ap_*" still expand.
std::string ShellRootPath(const std::string& path);

// A shell command line with every absolute program in command position (at the start and after
// "|", "||", "&&", ";", "&", "(" or a newline, outside quotes) moved under the root.
std::string RootShellCommand(const std::string& commandLine);

// Puts the root's program folders (usr/vorn/bin, usr/vorn/sbin, usr/sbin, usr/bin, sbin, bin) in
// front of PATH when a root is set. Daemons and tools call it once at start.
void PrefixPathWithRoot();

// Single-quotes a word for a shell command line when it holds anything but safe characters.
std::string ShellQuote(const std::string& word);

}  // namespace platform
}  // namespace vorn

#endif
