#include "platform/shell_command.h"

#include <cstdio>
#include <vector>

#include "platform/root_path.h"
#include "utils/log.h"

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

int ReadShellCommandLines(const std::string& commandLine, std::vector<std::string>& lines,
                          std::size_t maxLines, std::size_t maxBytes, bool* succeeded) {
    lines.clear();
    FILE* pipe = popen(RootShellCommand(commandLine).c_str(), "re");
    if (pipe == nullptr) {
        return -1;
    }
    std::vector<char> buffer(maxBytes + 2, '\0');
    bool partial = false;
    while (lines.size() < maxLines &&
           std::fgets(buffer.data(), static_cast<int>(buffer.size()), pipe) != nullptr) {
        const std::string piece = buffer.data();
        const bool ended = !piece.empty() && piece.back() == '\n';
        if (!partial && ended) {
            lines.push_back(piece.substr(0, piece.size() - 1));
        }
        partial = !ended;
    }
    if (lines.size() >= maxLines && std::fgets(buffer.data(), 2, pipe) != nullptr) {
        VORN_LOG(LOG_WARNING, "Output of [%s] cut at %zu lines", commandLine.c_str(), maxLines);
    }
    const bool exitedWithZero = pclose(pipe) == 0;
    if (succeeded != nullptr) {
        *succeeded = exitedWithZero || lines.size() >= maxLines;
    }
    return 0;
}

}  // namespace platform
}  // namespace vorn
