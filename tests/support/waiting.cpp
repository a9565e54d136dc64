#include "support/waiting.h"

#include <gtest/gtest.h>
#include <stdlib.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <thread>
#include <utility>
#include <vector>

#include "platform/shell_command.h"

namespace vorn {
namespace test {

bool WaitFor(const std::function<bool()>& done, std::chrono::milliseconds limit) {
    const auto deadline = std::chrono::steady_clock::now() + limit;
    while (!done()) {
        if (std::chrono::steady_clock::now() > deadline) {
            return false;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(20));
    }
    return true;
}

char ProcessState(long pid) {
    std::string stat;
    std::getline(std::ifstream("/proc/" + std::to_string(pid) + "/stat"), stat);
    const std::string::size_type close = stat.rfind(") ");
    return close == std::string::npos || close + 2 >= stat.size() ? '\0' : stat[close + 2];
}

std::string Shell(const std::string& command) {
    std::vector<std::string> lines;
    EXPECT_EQ(platform::ReadShellCommandLines(command + " 2>&1", lines), 0) << command;
    std::string text;
    for (const std::string& line : lines) {
        text += line + "\n";
    }
    return text;
}

SavedVariable::SavedVariable(std::string name) : name_(std::move(name)) {
    if (const char* value = std::getenv(name_.c_str())) {
        value_ = value;
    }
}

SavedVariable::~SavedVariable() {
    if (value_) {
        setenv(name_.c_str(), value_->c_str(), 1);
    } else {
        unsetenv(name_.c_str());
    }
}

std::string MakeTempDir(const std::string& prefix) {
    std::error_code error;
    std::string pattern = (std::filesystem::temp_directory_path(error) / (prefix + "-XXXXXX"));
    return !error && mkdtemp(&pattern[0]) != nullptr ? pattern : "";
}

}  // namespace test
}  // namespace vorn
