#ifndef VORN_TEST_WAITING_H
#define VORN_TEST_WAITING_H

#include <chrono>
#include <functional>
#include <optional>
#include <string>

namespace vorn {
namespace test {

// Polls done every 20 ms until it holds (true) or limit passes (false).
bool WaitFor(const std::function<bool()>& done,
             std::chrono::milliseconds limit = std::chrono::seconds(20));

// Every output line of a shell command line, standard error included, its absolute programs run
// under the root as the library's own command lines are.
std::string Shell(const std::string& command);

// Remembers an environment variable (or its absence) and puts it back when it goes.
class SavedVariable {
  public:
    explicit SavedVariable(std::string name);
    ~SavedVariable();
    SavedVariable(const SavedVariable&) = delete;
    SavedVariable& operator=(const SavedVariable&) = delete;

  private:
    std::string name_;
    std::optional<std::string> value_;
};

// The state letter of a process in /proc ('R', 'S', 'T' when stopped, 'Z' when a zombie, …);
// '\0' once it is gone.
char ProcessState(long pid);
// Gone, or a zombie no one has reaped yet: either way no longer running.
inline bool HasEnded(long pid) {
    const char state = ProcessState(pid);
    return state == '\0' || state == 'Z';
}

// A new folder under TMPDIR (or /tmp) named prefix and a random tail; "" when none can be made.
std::string MakeTempDir(const std::string& prefix);

}  // namespace test
}  // namespace vorn

#endif
