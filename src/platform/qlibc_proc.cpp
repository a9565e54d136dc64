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
#include "platform/spawn_setup.h"

extern char** environ;

namespace {

using vorn::platform::SpawnActions;
using vorn::platform::SpawnAttributes;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

int WaitForExit(pid_t pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0) {
        if (errno != EINTR) {
            return Fail(QLIBC_ERR_EXEC);
        }
    }
    if (WIFEXITED(status) && WEXITSTATUS(status) == 0) {
        return 0;
    }
    return Fail(QLIBC_ERR_EXEC);
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
    SpawnAttributes attributes;

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
    if (flags & QLIBC_EXEC_WAIT) {
        return WaitForExit(pid);
    }
    std::thread([pid] { WaitForExit(pid); }).detach();
    return 0;
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

}  // extern "C"
