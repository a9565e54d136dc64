#ifndef VORN_TEST_SIM_ROOT_H
#define VORN_TEST_SIM_ROOT_H

#include <gtest/gtest.h>
#include <json/json.h>

#include <map>
#include <string>
#include <vector>

#include "support/log_capture.h"
#include "support/waiting.h"

namespace vorn {
namespace test {

// A fresh simulated appliance root (sim/make-root) in a temporary directory. While the object
// lives, VORN_ROOT points at it and PATH starts with its program folders; both are restored and
// the directory removed afterwards.
class SimRoot {
  public:
    enum class Kind { kSimulated, kLive };
    explicit SimRoot(Kind kind = Kind::kSimulated);
    ~SimRoot();
    SimRoot(const SimRoot&) = delete;
    SimRoot& operator=(const SimRoot&) = delete;

    const std::string& Dir() const { return dir_; }
    // The real path of a logical absolute path.
    std::string Path(const std::string& logical) const;
    bool Exists(const std::string& logical) const;
    // Writes a file (creating its directories); ReadFile gives "" for a missing file.
    void WriteFile(const std::string& logical, const std::string& content) const;
    std::string ReadFile(const std::string& logical) const;
    // Every regular file by logical path with its content, the simulator's own records left out.
    std::map<std::string, std::string> Files() const;
    // What vornwifid needs to come up with the radio wlan0 in the router topology: what the
    // radio reports, the kernel files the simulated brctl does not make, and an address br0 can
    // take over from eth0.
    void PrepareRadio() const;

    // Replaces the scenario of a simulated program (named by its base name, e.g. "ip"): rule
    // blocks "when GLOB" followed by "print LINE", "stderr LINE" and "exit N" lines; see
    // sim/README.md.
    void Scenario(const std::string& program, const std::string& text) const;
    // The recorded calls of simulated programs, one line each: logical program path and argument
    // words, joined by single blanks, words shell-quoted where needed.
    std::vector<std::string> Calls() const;
    void ClearCalls() const;

    // A script at a hook point (e.g. "ipv4_change") that, at each run, appends one line: the
    // given text with the hook's variables expanded. HookRuns gives those lines in order.
    void RecordHook(const std::string& point, const std::string& line) const;
    std::vector<std::string> HookRuns(const std::string& point) const;

  private:
    SavedVariable savedRoot_{"VORN_ROOT"};
    SavedVariable savedPath_{"PATH"};
    std::string dir_;
};

// The lines of a text, without their line breaks.
std::vector<std::string> Lines(const std::string& text);
// A JSON text parsed; one that does not parse fails the test.
Json::Value Parse(const std::string& text);

// Base fixture of unit tests: a fresh simulated root and captured log lines for every test.
class RootTest : public ::testing::Test {
  protected:
    LogCapture log_;
    SimRoot root_;
};

}  // namespace test
}  // namespace vorn

#endif
