#include "platform/shell_command.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <thread>

#include "platform/root_path.h"
#include "platform/spawn_setup.h"
#include "utils/log.h"

extern char** environ;

namespace vorn {
namespace platform {
namespace {

constexpr int kDefaultTimeoutMs = 60000;
// Most programs end within milliseconds: poll often at first, then back off.
constexpr auto kFirstPoll = std::chrono::microseconds(200);
constexpr auto kLongestPoll = std::chrono::microseconds(10000);

std::atomic<int> timeoutMs{kDefaultTimeoutMs};

int MillisecondsUntil(Deadline deadline) {
    const auto left =
        std::chrono::duration_cast<std::chrono::milliseconds>(deadline - Deadline::clock::now());
    return static_cast<int>(std::max<std::chrono::milliseconds::rep>(left.count(), 0));
}

// "sh -c LINE" in a process group of its own, its standard output read through a pipe until a
// deadline, fgets-style.
class ShellOutput {
  public:
    explicit ShellOutput(const std::string& commandLine)
        : commandLine_(commandLine), deadline_(ProgramDeadline()) {
        Start(RootShellCommand(commandLine));
    }
    ~ShellOutput() {
        bool ignored = false;
        Finish(ignored);
    }
    ShellOutput(const ShellOutput&) = delete;
    ShellOutput& operator=(const ShellOutput&) = delete;

    bool Started() const { return pid_ > 0; }

    // The next piece of output as fgets into size bytes would give it; false at the end of the
    // output or at the deadline.
    bool Gets(std::string& piece, std::size_t size) {
        const std::size_t most = size > 1 ? size - 1 : 1;
        for (;;) {
            const std::size_t end = pending_.find('\n');
            if (end != std::string::npos && end < most) {
                return Take(piece, end + 1);
            }
            if (pending_.size() >= most || (ended_ && !pending_.empty())) {
                return Take(piece, std::min(most, pending_.size()));
            }
            if (ended_ || !ReadMore()) {
                return false;
            }
        }
    }

    // Closes the output and waits for the command. False when it had to be killed; exitedWithZero
    // tells how it ended otherwise.
    bool Finish(bool& exitedWithZero) {
        exitedWithZero = false;
        if (fd_ >= 0) {
            close(fd_);
            fd_ = -1;
        }
        if (pid_ <= 0) {
            return pid_ == 0;
        }
        int status = 0;
        const bool ended = WaitUntil(pid_, commandLine_, deadline_, status);
        pid_ = 0;
        exitedWithZero = ended && WIFEXITED(status) && WEXITSTATUS(status) == 0;
        return ended;
    }

  private:
    void Start(const std::string& rooted) {
        int ends[2];
        if (pipe2(ends, O_CLOEXEC) != 0) {
            return;
        }
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_addopen(&actions, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_adddup2(&actions, ends[1], STDOUT_FILENO);
        const SpawnAttributes attributes(true);
        char* const argv[] = {const_cast<char*>("sh"), const_cast<char*>("-c"),
                              const_cast<char*>(rooted.c_str()), nullptr};
        pid_t pid = -1;
        if (posix_spawn(&pid, "/bin/sh", &actions, attributes.Get(), argv, environ) == 0) {
            pid_ = pid;
            fd_ = ends[0];
        } else {
            close(ends[0]);
        }
        posix_spawn_file_actions_destroy(&actions);
        close(ends[1]);
    }

    bool ReadMore() {
        pollfd ready{fd_, POLLIN, 0};
        int polled = 0;
        while ((polled = poll(&ready, 1, MillisecondsUntil(deadline_))) < 0 && errno == EINTR) {
        }
        if (polled <= 0) {
            return false;
        }
        char buffer[4096];
        ssize_t count = 0;
        while ((count = read(fd_, buffer, sizeof(buffer))) < 0 && errno == EINTR) {
        }
        if (count <= 0) {
            ended_ = true;
        } else {
            pending_.append(buffer, static_cast<std::size_t>(count));
        }
        return true;
    }

    bool Take(std::string& piece, std::size_t count) {
        piece = pending_.substr(0, count);
        pending_.erase(0, count);
        return true;
    }

    const std::string commandLine_;
    const Deadline deadline_;
    pid_t pid_ = -1;
    int fd_ = -1;
    std::string pending_;
    bool ended_ = false;
};

}  // namespace

void SetProgramTimeout(int milliseconds) {
    timeoutMs = milliseconds > 0 ? milliseconds : kDefaultTimeoutMs;
}

int ProgramTimeout() {
    return timeoutMs.load();
}

Deadline ProgramDeadline() {
    return Deadline::clock::now() + std::chrono::milliseconds(ProgramTimeout());
}

bool WaitUntil(pid_t pid, const std::string& program, Deadline deadline, int& status) {
    std::chrono::microseconds poll = kFirstPoll;
    for (;;) {
        const pid_t done = waitpid(pid, &status, WNOHANG);
        if (done == pid) {
            return true;
        }
        if (done < 0 && errno != EINTR) {
            VORN_LOG(LOG_ERR, "Failed to wait for [%s] errno [%d]", program.c_str(), errno);
            return false;
        }
        if (Deadline::clock::now() >= deadline) {
            // Still unreaped, so the group id cannot have been reused.
            kill(-pid, SIGKILL);
            while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
            }
            VORN_LOG(LOG_ERR, "Killed [%s]: still running at its deadline", program.c_str());
            return false;
        }
        std::this_thread::sleep_for(poll);
        poll = std::min(poll * 2, kLongestPoll);
    }
}

int ReadShellCommandLine(const std::string& commandLine, std::string& line, std::size_t maxBytes) {
    line.clear();
    ShellOutput output(commandLine);
    if (!output.Started()) {
        return -1;
    }
    output.Gets(line, maxBytes > 1 ? maxBytes : 2);
    bool exitedWithZero = false;
    return output.Finish(exitedWithZero) ? 0 : -1;
}

int ReadShellCommandLines(const std::string& commandLine, std::vector<std::string>& lines,
                          std::size_t maxLines, std::size_t maxBytes, bool* succeeded) {
    lines.clear();
    if (succeeded != nullptr) {
        *succeeded = false;
    }
    ShellOutput output(commandLine);
    if (!output.Started()) {
        return -1;
    }
    std::string piece;
    bool partial = false;
    while (lines.size() < maxLines && output.Gets(piece, maxBytes + 2)) {
        const bool ended = !piece.empty() && piece.back() == '\n';
        if (!partial && ended) {
            lines.push_back(piece.substr(0, piece.size() - 1));
        }
        partial = !ended;
    }
    if (lines.size() >= maxLines && output.Gets(piece, 2)) {
        VORN_LOG(LOG_WARNING, "Output of [%s] cut at %zu lines", commandLine.c_str(), maxLines);
    }
    bool exitedWithZero = false;
    if (!output.Finish(exitedWithZero)) {
        lines.clear();
        return -1;
    }
    if (succeeded != nullptr) {
        *succeeded = exitedWithZero || lines.size() >= maxLines;
    }
    return 0;
}

}  // namespace platform
}  // namespace vorn
