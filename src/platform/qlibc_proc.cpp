#include "platform/qlibc_proc.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

#include "platform/qlibc_error.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/spawn_setup.h"
#include "utils/process.h"

extern char** environ;

namespace {

using vorn::platform::SpawnActions;
using vorn::platform::SpawnAttributes;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

int ExitResult(int status) {
    return WIFEXITED(status) && WEXITSTATUS(status) == 0 ? 0 : Fail(QLIBC_ERR_EXEC);
}

void ReapInBackground(pid_t pid) {
    std::thread([pid] {
        int status = 0;
        while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
        }
    }).detach();
}

// The program and its argument words, for the log.
std::string CommandText(const std::vector<char*>& argv) {
    std::string text;
    for (const char* word : argv) {
        if (word != nullptr) {
            text += (text.empty() ? "" : " ") + std::string(word);
        }
    }
    return text;
}

int Run(const char* program, int flags, const std::vector<const char*>& args) {
    if (program == nullptr || program[0] == '\0') {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::vector<char*> argv;
    argv.reserve(args.size() + 2);
    argv.push_back(const_cast<char*>(program));
    for (const char* arg : args) {
        argv.push_back(const_cast<char*>(arg));
    }
    argv.push_back(nullptr);

    SpawnActions actions;
    if (flags & QLIBC_EXEC_NO_STDIN) {
        actions.Silence(STDIN_FILENO, O_RDONLY);
    }
    if (flags & QLIBC_EXEC_NO_STDOUT) {
        actions.Silence(STDOUT_FILENO, O_WRONLY);
    }
    if (flags & QLIBC_EXEC_NO_STDERR) {
        actions.Silence(STDERR_FILENO, O_WRONLY);
    }
    // A program waited for runs in a group of its own, so that the deadline kills all it started.
    const bool wait = (flags & QLIBC_EXEC_WAIT) != 0;
    const SpawnAttributes attributes(wait);
    const auto deadline = vorn::platform::ProgramDeadline();

    pid_t pid = -1;
    int result = 0;
    if (program[0] == '/') {
        const std::string path = vorn::platform::RootPath(program);
        result =
            posix_spawn(&pid, path.c_str(), actions.Get(), attributes.Get(), argv.data(), environ);
    } else {
        result = posix_spawnp(&pid, program, actions.Get(), attributes.Get(), argv.data(), environ);
    }
    if (result != 0) {
        return Fail(QLIBC_ERR_EXEC);
    }
    if (!wait) {
        ReapInBackground(pid);
        return 0;
    }
    int status = 0;
    if (!vorn::platform::WaitUntil(pid, CommandText(argv), deadline, status)) {
        return Fail(QLIBC_ERR_EXEC);
    }
    return ExitResult(status);
}

}  // namespace

extern "C" {

int QLIBCExecl(const char* program, int flags, ...) {
    std::vector<const char*> args;
    va_list list;
    va_start(list, flags);
    for (const char* arg = va_arg(list, const char*); arg != nullptr;
         arg = va_arg(list, const char*)) {
        args.push_back(arg);
    }
    va_end(list);
    return Run(program, flags, args);
}

int QLIBCExec(const char* program, const char* arg1, const char* arg2, const char* arg3,
              const char* arg4) {
    std::vector<const char*> args;
    for (const char* arg : {arg1, arg2, arg3, arg4}) {
        if (arg == nullptr) {
            break;
        }
        args.push_back(arg);
    }
    return Run(program, QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, args);
}

int QLIBCSystem(const char* commandLine) {
    if (commandLine == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string rooted = vorn::platform::RootShellCommand(commandLine);
    return Run("sh", QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN, {"-c", rooted.c_str()});
}

void QLIBCExecSetTimeout(int milliseconds) {
    vorn::platform::SetProgramTimeout(milliseconds);
}

int QLIBCProcPidFileCreate(const char* path) {
    if (path == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string real = vorn::platform::RootPath(path);
    const std::string temp = real + ".tmp." + std::to_string(getpid());
    {
        std::ofstream out(temp, std::ios::trunc);
        out << getpid() << '\n';
        out.close();
        if (!out) {
            unlink(temp.c_str());
            return Fail(QLIBC_ERR_FILE_IO);
        }
    }
    if (rename(temp.c_str(), real.c_str()) != 0) {
        unlink(temp.c_str());
        return Fail(QLIBC_ERR_FILE_IO);
    }
    return 0;
}

int QLIBCReadPidFile(const char* path) {
    if (path == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::ifstream in(vorn::platform::RootPath(path));
    if (!in) {
        return Fail(QLIBC_ERR_NOT_FOUND);
    }
    char text[32] = {};
    in.getline(text, sizeof(text));
    char* end = nullptr;
    errno = 0;
    const long pid = std::strtol(text, &end, 10);
    if (end == text || errno != 0 || pid <= 0 || pid > 0x7fffffffL) {
        return 0;
    }
    return static_cast<int>(pid);
}

int QLIBCProcAlive(int pid) {
    if (pid <= 0) {
        return 0;
    }
    return (kill(pid, 0) == 0 || errno == EPERM) ? 1 : 0;
}

int QLIBCProcSignalByPidFile(const char* path, int signal) {
    const int pid = QLIBCReadPidFile(path);
    if (pid <= 0) {
        return Fail(QLIBC_ERR_NOT_FOUND);
    }
    return kill(pid, signal) == 0 ? 0 : Fail(QLIBC_ERR_INVALID_ARG);
}

int QLIBCProcKillByName(const char* name, int signal) {
    std::vector<int> pids;
    if (name == nullptr || name[0] == '\0' || !vornwireless::utils::FindProcesses(name, pids)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    int signalled = 0;
    bool refused = false;
    for (const int pid : pids) {
        if (kill(pid, signal) == 0) {
            ++signalled;
        } else if (errno != ESRCH) {
            refused = true;
        }
    }
    return refused ? Fail(QLIBC_ERR_INVALID_ARG) : signalled;
}

}  // extern "C"
