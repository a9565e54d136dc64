#include "support/private_bus.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>

#include "dbus/dbus_client.h"
#include "support/waiting.h"

extern char** environ;

namespace vorn {
namespace test {
namespace {

constexpr char kBusVariable[] = "DBUS_SESSION_BUS_ADDRESS";
constexpr DaemonProcess::Timeout kBusStartTimeout{10000};
constexpr DaemonProcess::Timeout kStopGrace{5000};
constexpr std::size_t kMaxOutputBytes = 1 << 20;

std::string ReadBounded(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::string text(kMaxOutputBytes, '\0');
    in.read(&text[0], static_cast<std::streamsize>(text.size()));
    text.resize(static_cast<std::size_t>(in.gcount()));
    return text;
}

}  // namespace

PrivateBus::PrivateBus()
    : daemon_(std::make_unique<DaemonProcess>(
          std::vector<std::string>{"dbus-daemon", "--session", "--nofork", "--print-address"})) {
    std::string out;
    WaitFor(
        [&] {
            out = daemon_->Stdout();
            return out.find('\n') != std::string::npos || !daemon_->Running();
        },
        kBusStartTimeout);
    if (out.find('\n') == std::string::npos) {
        ADD_FAILURE() << "dbus-daemon printed no address: " << daemon_->Stderr();
        return;
    }
    savedAddress_ = std::make_unique<SavedVariable>(kBusVariable);
    address_ = out.substr(0, out.find('\n'));
    setenv(kBusVariable, address_.c_str(), 1);
}

PrivateBus::~PrivateBus() = default;

pid_t PrivateBus::Pid() const {
    return daemon_->Pid();
}

DaemonProcess::DaemonProcess(const std::vector<std::string>& argv)
    : dir_(MakeTempDir("vorn-process")) {
    if (dir_.empty() || argv.empty()) {
        ADD_FAILURE() << "cannot make a folder for the output of " << (argv.empty() ? "" : argv[0]);
        return;
    }
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 0, "/dev/null", O_RDONLY, 0);
    const std::string out = dir_ + "/stdout";
    const std::string err = dir_ + "/stderr";
    posix_spawn_file_actions_addopen(&actions, 1, out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    posix_spawn_file_actions_addopen(&actions, 2, err.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    std::vector<std::string> words = argv;
    std::vector<char*> args;
    for (std::string& word : words) {
        args.push_back(&word[0]);
    }
    args.push_back(nullptr);
    const int error = posix_spawnp(&pid_, args[0], &actions, nullptr, args.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (error != 0) {
        pid_ = -1;
        ADD_FAILURE() << "cannot run " << argv[0] << ": " << std::strerror(error);
    }
}

// SIGTERM, a grace period, then SIGKILL: a program never outlives its test.
DaemonProcess::~DaemonProcess() {
    if (Signal(SIGTERM) && WaitForExit(kStopGrace) < 0) {
        kill(pid_, SIGKILL);
        Reap(0);
    }
    if (!dir_.empty()) {
        std::error_code ignored;
        std::filesystem::remove_all(dir_, ignored);
    }
}

bool DaemonProcess::Reap(int options) {
    if (status_ != -1) {
        return true;
    }
    int status = 0;
    pid_t done = -1;
    do {
        done = waitpid(pid_, &status, options);
    } while (done < 0 && errno == EINTR);
    if (done != pid_) {
        return false;
    }
    status_ = status;
    return true;
}

bool DaemonProcess::Running() {
    return Started() && !Reap(WNOHANG);
}

bool DaemonProcess::WaitForBusName(const std::string& name, Timeout timeout) {
    return WaitFor(
               [&] {
                   const vornwireless::dbus::DBusClient probe(name.c_str(), "/", name.c_str(),
                                                              vornwireless::dbus::DBUS_BUS_SESSION);
                   return !Running() || probe.IsServerReady();
               },
               timeout) &&
           Running();
}

bool DaemonProcess::Signal(int signal) {
    return Running() && kill(pid_, signal) == 0;
}

int DaemonProcess::WaitForExit(Timeout timeout) {
    if (!Started() || !WaitFor([this] { return Reap(WNOHANG); }, timeout)) {
        return -1;
    }
    if (WIFEXITED(status_)) {
        return WEXITSTATUS(status_);
    }
    return WIFSIGNALED(status_) ? 128 + WTERMSIG(status_) : -1;
}

std::string DaemonProcess::Stdout() const {
    return ReadBounded(dir_ + "/stdout");
}

std::string DaemonProcess::Stderr() const {
    return ReadBounded(dir_ + "/stderr");
}

int RunProgram(const std::vector<std::string>& argv, DaemonProcess::Timeout timeout,
               std::string* out, std::string* err) {
    DaemonProcess program(argv);
    const int code = program.WaitForExit(timeout);
    if (out != nullptr) {
        *out = program.Stdout();
    }
    if (err != nullptr) {
        *err = program.Stderr();
    }
    return code;
}

}  // namespace test
}  // namespace vorn
