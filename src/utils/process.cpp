#include "utils/process.h"

#include <dirent.h>

#include <cctype>
#include <cstdlib>
#include <fstream>
#include <memory>
#include <string>

namespace vornwireless {
namespace utils {
namespace {

// The kernel keeps only this much of a program's name in /proc/PID/stat.
constexpr std::size_t kCommLength = 15;
// A program's file name is at most this long; longer text cannot be one.
constexpr std::size_t kMaxNameLength = 255;

// The file name of the program the process runs, from its first argument word.
std::string ProgramName(const std::string& pid) {
    std::ifstream stream("/proc/" + pid + "/cmdline", std::ios::binary);
    std::string first;
    std::getline(stream, first, '\0');
    const std::size_t slash = first.rfind('/');
    return slash == std::string::npos ? first : first.substr(slash + 1);
}

// Whether a live (not zombie) process runs exactly the named program.
bool RunsProgram(const std::string& pid, const std::string& name) {
    // "PID (comm) S ...": comm may hold blanks and parentheses, the state follows the last ')'.
    std::ifstream stream("/proc/" + pid + "/stat");
    std::string stat;
    std::getline(stream, stat);
    const std::size_t open = stat.find('(');
    const std::size_t close = stat.rfind(')');
    if (open == std::string::npos || close == std::string::npos || close < open ||
        close + 2 >= stat.size() || stat[close + 2] == 'Z') {
        return false;
    }
    const std::string comm = stat.substr(open + 1, close - open - 1);
    if (comm.size() < kCommLength) {
        return comm == name;
    }
    // A comm of full length may be a longer name cut short.
    return name.compare(0, kCommLength, comm) == 0 && ProgramName(pid) == name;
}

bool IsPid(const char* text) {
    for (; *text != '\0'; ++text) {
        if (!std::isdigit(static_cast<unsigned char>(*text))) {
            return false;
        }
    }
    return true;
}

}  // namespace

bool IsProcessAlive(const std::string& name) {
    std::vector<int> pids;
    return FindProcesses(name, pids) && !pids.empty();
}

bool FindProcesses(const std::string& name, std::vector<int>& pids) {
    pids.clear();
    const std::unique_ptr<DIR, int (*)(DIR*)> proc(opendir("/proc"), &closedir);
    if (!proc) {
        return false;
    }
    if (name.empty() || name.size() > kMaxNameLength || name.find('/') != std::string::npos) {
        return true;
    }
    while (const dirent* entry = readdir(proc.get())) {
        if (IsPid(entry->d_name) && RunsProgram(entry->d_name, name)) {
            pids.push_back(std::atoi(entry->d_name));
        }
    }
    return true;
}

}  // namespace utils
}  // namespace vornwireless
