#include "support/private_bus.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <thread>

#include "dbus/dbus_client.h"

extern char** environ;

namespace vorn {
namespace test {
namespace {

using Clock = std::chrono::steady_clock;
using Timeout = DaemonProcess::Timeout;

constexpr char kBusVariable[] = "DBUS_SESSION_BUS_ADDRESS";
constexpr Timeout kBusStartTimeout{10000};
constexpr Timeout kStopGrace{5000};
constexpr Timeout kPollInterval{10};
constexpr std::size_t kMaxAddressBytes = 4096;
constexpr std::size_t kMaxOutputBytes = 1 << 20;

// The exit status of a wait status, shell style.
int ExitCode(int status) {
    if (WIFEXITED(status)) {
        return WEXITSTATUS(status);
    }
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : -1;
}

// waitpid that gives up at the deadline: true with status once the child ended.
bool WaitForChild(pid_t pid, Timeout timeout, int& status) {
    const auto deadline = Clock::now() + timeout;
    for (;;) {
        const pid_t done = waitpid(pid, &status, WNOHANG);
        if (done == pid) {
            return true;
        }
        if (done < 0 && errno != EINTR) {
            return false;
        }
        if (Clock::now() >= deadline) {
            return false;
        }
        std::this_thread::sleep_for(kPollInterval);
    }
}

// SIGTERM, a grace period, then SIGKILL: a child never outlives its owner.
void StopChild(pid_t pid) {
    int status = 0;
    kill(pid, SIGTERM);
    if (!WaitForChild(pid, kStopGrace, status)) {
        kill(pid, SIGKILL);
        while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
        }
    }
}

std::vector<char*> ArgvOf(std::vector<std::string>& words) {
    std::vector<char*> argv;
    for (std::string& word : words) {
        argv.push_back(&word[0]);
    }
    argv.push_back(nullptr);
    return argv;
}

// The first line the daemon writes to fd, without its line end; "" when none comes in time.
std::string ReadLine(int fd, Timeout timeout) {
    const auto deadline = Clock::now() + timeout;
    std::string line;
    while (line.size() < kMaxAddressBytes) {
        const auto left = std::chrono::duration_cast<Timeout>(deadline - Clock::now());
        pollfd ready = {fd, POLLIN, 0};
        if (left.count() <= 0 || poll(&ready, 1, static_cast<int>(left.count())) <= 0) {
            return "";
        }
        char c = 0;
        const ssize_t got = read(fd, &c, 1);
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got <= 0) {
            return "";
        }
        if (c == '\n') {
            return line;
        }
        line.push_back(c);
    }
    return "";
}

std::string MakeTempDir(const char* prefix) {
    const char* tmp = std::getenv("TMPDIR");
    std::string pattern =
        std::string(tmp != nullptr && *tmp != '\0' ? tmp : "/tmp") + "/" + prefix + "-XXXXXX";
    return mkdtemp(&pattern[0]) != nullptr ? pattern : "";
}

std::string ReadBounded(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::string text;
    std::istreambuf_iterator<char> it(in);
    for (const std::istreambuf_iterator<char> end; it != end && text.size() < kMaxOutputBytes;
         ++it) {
        text.push_back(*it);
    }
    return text;
}

}  // namespace

PrivateBus::PrivateBus() {
    int fds[2];
    if (pipe2(fds, O_CLOEXEC) != 0) {
        ADD_FAILURE() << "pipe: " << std::strerror(errno);
        return;
    }
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, fds[1], 3);
    std::vector<std::string> words{"dbus-daemon", "--session", "--nofork", "--print-address=3"};
    const std::vector<char*> argv = ArgvOf(words);
    const int error = posix_spawnp(&pid_, argv[0], &actions, nullptr, argv.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    close(fds[1]);
    if (error != 0) {
        pid_ = -1;
        close(fds[0]);
        ADD_FAILURE() << "cannot run dbus-daemon: " << std::strerror(error);
        return;
    }
    const std::string address = ReadLine(fds[0], kBusStartTimeout);
    close(fds[0]);
    if (address.empty()) {
        ADD_FAILURE() << "dbus-daemon printed no address within " << kBusStartTimeout.count()
                      << " ms";
        return;
    }
    const char* saved = std::getenv(kBusVariable);
    hadAddress_ = saved != nullptr;
    savedAddress_ = hadAddress_ ? saved : "";
    setenv(kBusVariable, address.c_str(), 1);
    address_ = address;
}

PrivateBus::~PrivateBus() {
    if (Started()) {
        if (hadAddress_) {
            setenv(kBusVariable, savedAddress_.c_str(), 1);
        } else {
            unsetenv(kBusVariable);
        }
    }
    if (pid_ > 0) {
        StopChild(pid_);
    }
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
    const std::vector<char*> args = ArgvOf(words);
    const int error = posix_spawnp(&pid_, args[0], &actions, nullptr, args.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (error != 0) {
        pid_ = -1;
        ADD_FAILURE() << "cannot run " << argv[0] << ": " << std::strerror(error);
    }
}

DaemonProcess::~DaemonProcess() {
    if (Started() && !Reap(WNOHANG)) {
        StopChild(pid_);
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
    const auto deadline = Clock::now() + timeout;
    while (Running()) {
        const vornwireless::dbus::DBusClient probe(name.c_str(), "/", name.c_str(),
                                                   vornwireless::dbus::DBUS_BUS_SESSION);
        if (probe.IsServerReady()) {
            return true;
        }
        if (Clock::now() >= deadline) {
            return false;
        }
        std::this_thread::sleep_for(kPollInterval);
    }
    return false;
}

bool DaemonProcess::Signal(int signal) {
    return Running() && kill(pid_, signal) == 0;
}

int DaemonProcess::WaitForExit(Timeout timeout) {
    if (!Started()) {
        return -1;
    }
    const auto deadline = Clock::now() + timeout;
    while (!Reap(WNOHANG)) {
        if (Clock::now() >= deadline) {
            return -1;
        }
        std::this_thread::sleep_for(kPollInterval);
    }
    return ExitCode(status_);
}

std::string DaemonProcess::Stdout() const {
    return ReadBounded(dir_ + "/stdout");
}

std::string DaemonProcess::Stderr() const {
    return ReadBounded(dir_ + "/stderr");
}

int RunProgram(const std::vector<std::string>& argv, Timeout timeout, std::string* out,
               std::string* err) {
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
