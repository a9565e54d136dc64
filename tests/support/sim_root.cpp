#include "support/sim_root.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <vector>

#include "platform/root_path.h"
#include "support/private_bus.h"
#include "support/waiting.h"
#include "utils/json_text.h"

namespace vorn {
namespace test {
namespace {

namespace fs = std::filesystem;

const char kCallLog[] = "/.vornsim/calls";
const char kScenarioDir[] = "/.vornsim/scenario/";

// A root that cannot be built leaves nothing meaningful to test: stop the whole run.
[[noreturn]] void Die(const std::string& what) {
    std::fprintf(stderr, "SimRoot: %s\n", what.c_str());
    std::abort();
}

void RunMakeRoot(SimRoot::Kind kind, const std::string& dir) {
    std::vector<std::string> argv{VORN_SOURCE_DIR "/sim/make-root", dir};
    if (kind == SimRoot::Kind::kLive) {
        argv.insert(argv.begin() + 1, "--live");
    }
    std::string err;
    if (dir.empty() || RunProgram(argv, std::chrono::seconds(60), nullptr, &err) != 0) {
        Die("sim/make-root " + dir + " failed: " + err);
    }
}

}  // namespace

SimRoot::SimRoot(Kind kind) : dir_(MakeTempDir("vorn-root")) {
    RunMakeRoot(kind, dir_);
    setenv("VORN_ROOT", dir_.c_str(), 1);
    platform::PrefixPathWithRoot();
}

SimRoot::~SimRoot() {
    std::error_code ignored;
    fs::remove_all(dir_, ignored);
}

std::string SimRoot::Path(const std::string& logical) const {
    return !logical.empty() && logical[0] == '/' ? dir_ + logical : dir_ + "/" + logical;
}

bool SimRoot::Exists(const std::string& logical) const {
    std::error_code ignored;
    return fs::exists(Path(logical), ignored);
}

void SimRoot::WriteFile(const std::string& logical, const std::string& content) const {
    const fs::path path = Path(logical);
    std::error_code error;
    fs::create_directories(path.parent_path(), error);
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out << content;
    out.close();
    if (error || !out) {
        ADD_FAILURE() << "cannot write " << path;
    }
}

std::string SimRoot::ReadFile(const std::string& logical) const {
    // Streamed, so that files of /proc and /sys in a live root read whole.
    std::ifstream in(Path(logical), std::ios::binary);
    std::ostringstream content;
    if (in) {
        content << in.rdbuf();
    }
    return content.str();
}

void SimRoot::Scenario(const std::string& program, const std::string& text) const {
    if (program.empty() || program.find('/') != std::string::npos) {
        ADD_FAILURE() << "a scenario is named by the program's base name, not '" << program << "'";
        return;
    }
    WriteFile(kScenarioDir + program, text);
}

std::map<std::string, std::string> SimRoot::Files() const {
    std::map<std::string, std::string> files;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(dir_)) {
        const std::string logical = entry.path().string().substr(dir_.size());
        if (entry.is_regular_file() && !entry.is_symlink() && logical.rfind("/.vornsim", 0) != 0) {
            files[logical] = ReadFile(logical);
        }
    }
    return files;
}

void SimRoot::PrepareRadio() const {
    WriteFile("/etc/sysconfig/network-scripts/ifcfg-eth0",
              "DEVICE=eth0\nBOOTPROTO=static\nIPADDR=10.9.0.2\nNETMASK=255.255.255.0\n");
    Scenario("iwconfig", "when wlan0*\nprint wlan0     IEEE 802.11bgn  ESSID:off/any\n");
    for (const char* bridge : {"lbr0", "br0"}) {
        WriteFile(std::string("/proc/sys/net/ipv6/conf/") + bridge + "/disable_ipv6", "0\n");
    }
}

std::vector<std::string> SimRoot::Calls() const {
    return Lines(ReadFile(kCallLog));
}

void SimRoot::ClearCalls() const {
    std::error_code ignored;
    fs::remove(Path(kCallLog), ignored);
}

void SimRoot::RecordHook(const std::string& point, const std::string& line) const {
    const std::string script = "/etc/vorn/plugins/net/" + point + ".d/10-record";
    WriteFile(script, "#!/bin/sh\necho \"" + line + "\" >>" + Path("/tmp/" + point) + "\n");
    fs::permissions(Path(script), fs::perms::owner_all);
}

std::vector<std::string> SimRoot::HookRuns(const std::string& point) const {
    return Lines(ReadFile("/tmp/" + point));
}

std::vector<std::string> Lines(const std::string& text) {
    std::istringstream in(text);
    std::vector<std::string> lines;
    for (std::string line; std::getline(in, line);) {
        lines.push_back(line);
    }
    return lines;
}

Json::Value Parse(const std::string& text) {
    Json::Value value;
    EXPECT_TRUE(vornwireless::utils::ParseJson(text, value, 1 << 24)) << text;
    return value;
}

}  // namespace test
}  // namespace vorn
