#include "platform/root_path.h"

#include <cstdlib>
#include <cstring>

namespace vorn {
namespace platform {
namespace {

bool IsSafeShellChar(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
           (c != '\0' && std::strchr("_./-+=:,@%", c) != nullptr);
}

}  // namespace

std::string Root() {
    const char* env = std::getenv("VORN_ROOT");
    std::string root = env != nullptr ? env : "";
    while (!root.empty() && root.back() == '/') {
        root.pop_back();
    }
    return root;
}

std::string RootPath(const std::string& path) {
    if (path.empty() || path[0] != '/') {
        return path;
    }
    return Root() + path;
}

std::string ShellQuote(const std::string& word) {
    bool safe = !word.empty();
    for (char c : word) {
        safe = safe && IsSafeShellChar(c);
    }
    if (safe) {
        return word;
    }
    std::string quoted = "'";
    for (char c : word) {
        if (c == '\'') {
            quoted += "'\\''";
        } else {
            quoted += c;
        }
    }
    return quoted + "'";
}

std::string ShellRootPath(const std::string& path) {
    const std::string root = Root();
    if (root.empty() || path.empty() || path[0] != '/') {
        return path;
    }
    return ShellQuote(root) + path;
}

std::string RootShellCommand(const std::string& commandLine) {
    const std::string root = Root();
    if (root.empty()) {
        return commandLine;
    }
    const std::string quotedRoot = ShellQuote(root);
    std::string out;
    out.reserve(commandLine.size() + 4 * quotedRoot.size());
    bool commandPosition = true;
    char quote = '\0';
    for (size_t i = 0; i < commandLine.size(); ++i) {
        const char c = commandLine[i];
        if (quote != '\0') {
            out += c;
            if (c == quote) {
                quote = '\0';
            } else if (c == '\\' && quote == '"' && i + 1 < commandLine.size()) {
                out += commandLine[++i];
            }
            continue;
        }
        if (c == '\\' && i + 1 < commandLine.size()) {
            out += c;
            out += commandLine[++i];
            commandPosition = false;
            continue;
        }
        if (c == '|' || c == ';' || c == '&' || c == '(' || c == '\n') {
            commandPosition = true;
        } else if (c == ' ' || c == '\t') {
            // white space keeps the position
        } else {
            if (commandPosition && c == '/') {
                out += quotedRoot;
            }
            commandPosition = false;
            if (c == '\'' || c == '"') {
                quote = c;
            }
        }
        out += c;
    }
    return out;
}

void PrefixPathWithRoot() {
    const std::string root = Root();
    if (root.empty()) {
        return;
    }
    std::string path;
    for (const char* dir :
         {"/usr/vorn/bin", "/usr/vorn/sbin", "/usr/sbin", "/usr/bin", "/sbin", "/bin"}) {
        path += root + dir + ":";
    }
    const char* old = std::getenv("PATH");
    path += old != nullptr ? old : "/usr/sbin:/usr/bin:/sbin:/bin";
    setenv("PATH", path.c_str(), 1);
}

}  // namespace platform
}  // namespace vorn
