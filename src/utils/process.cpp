#include "utils/process.h"

#include <algorithm>
#include <cstdio>

#include "platform/shell_command.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr std::size_t kLineBytes = 1024;

bool IsSafeInSingleQuotes(const std::string& name) {
    return !name.empty() && std::none_of(name.begin(), name.end(), [](char c) {
        const unsigned char byte = static_cast<unsigned char>(c);
        return c == '\'' || c == '\\' || byte < 0x20 || byte == 0x7F;
    });
}

}  // namespace

bool IsProcessAlive(const std::string& name) {
    char command[kLineBytes];
    const int length = std::snprintf(
        command, sizeof(command), "/bin/ps -I | /bin/grep '%s' | /bin/grep -v grep", name.c_str());
    if (!IsSafeInSingleQuotes(name) || length < 0 ||
        static_cast<std::size_t>(length) >= sizeof(command)) {
        VORN_LOG(LOG_ERR, "Refused process name of %zu bytes for a shell line", name.size());
        return false;
    }
    std::string line;
    if (vorn::platform::ReadShellCommandLine(command, line, kLineBytes) != 0) {
        return false;
    }
    return line.find(name) != std::string::npos;
}

}  // namespace utils
}  // namespace vornwireless
