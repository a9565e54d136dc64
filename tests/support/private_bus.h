#ifndef VORN_TEST_PRIVATE_BUS_H
#define VORN_TEST_PRIVATE_BUS_H

#include <sys/types.h>

#include <chrono>
#include <memory>
#include <string>
#include <vector>

namespace vorn {
namespace test {

class DaemonProcess;
class SavedVariable;

// A private session bus (a dbus-daemon of our own). While the object lives,
// DBUS_SESSION_BUS_ADDRESS points at it, for this process and every program it starts; the
// variable is restored and the daemon stopped afterwards.
//
// GIO keeps one session-bus connection per process while anything holds it, and a connection
// whose bus goes away terminates its process: drop every client before the bus.
class PrivateBus {
  public:
    PrivateBus();
    ~PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;

    // False (and the test failed) when the daemon could not be started.
    bool Started() const { return !address_.empty(); }
    const std::string& Address() const { return address_; }
    pid_t Pid() const;

  private:
    std::unique_ptr<DaemonProcess> daemon_;
    std::string address_;
    std::unique_ptr<SavedVariable> savedAddress_;
};

// A program started with the current environment (VORN_ROOT, DBUS_SESSION_BUS_ADDRESS, PATH),
// its standard output and error going to files that the test reads. A program still running
// when the object goes is sent SIGTERM and, after a grace period, SIGKILL.
class DaemonProcess {
  public:
    using Timeout = std::chrono::milliseconds;

    // argv[0] is a path, or a name looked up in PATH.
    explicit DaemonProcess(const std::vector<std::string>& argv);
    ~DaemonProcess();
    DaemonProcess(const DaemonProcess&) = delete;
    DaemonProcess& operator=(const DaemonProcess&) = delete;

    // False (and the test failed) when the program could not be started.
    bool Started() const { return pid_ > 0; }
    pid_t Pid() const { return pid_; }
    bool Running();

    // True once name has an owner on the session bus (the bus daemon's ListNames); false when
    // the timeout passes or the program ends first.
    bool WaitForBusName(const std::string& name, Timeout timeout);
    bool Signal(int signal);
    // The exit status once the program ended (128 + N when signal N killed it); -1 when it still
    // runs after timeout.
    int WaitForExit(Timeout timeout);

    std::string Stdout() const;
    std::string Stderr() const;

  private:
    bool Reap(int options);

    pid_t pid_ = -1;
    int status_ = -1;
    std::string dir_;
};

// Runs a program to its end: its exit status, or -1 when it did not end within timeout.
int RunProgram(const std::vector<std::string>& argv, DaemonProcess::Timeout timeout,
               std::string* out = nullptr, std::string* err = nullptr);

}  // namespace test
}  // namespace vorn

#endif
