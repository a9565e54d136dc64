#include "platform/shell_command.h"

#include <cstdio>
#include <vector>

#include "platform/root_path.h"

namespace vorn {
namespace platform {

int ReadShellCommandLine(const std::string& commandLine, std::string& line, std::size_t maxBytes) {
    line.clear();
    FILE* pipe = popen(RootShellCommand(commandLine).c_str(), "re");
    if (pipe == nullptr) {
        return -1;
    }
    std::vector<char> buffer(maxBytes > 1 ? maxBytes : 2, '\0');
    if (std::fgets(buffer.data(), static_cast<int>(buffer.size()), pipe) != nullptr) {
        line = buffer.data();
    }
    pclose(pipe);
    return 0;
}

}  // namespace platform
}  // namespace vorn
