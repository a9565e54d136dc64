#include "platform/qlib_plugin.h"

#include <dirent.h>
#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <exception>
#include <map>
#include <new>
#include <string>
#include <thread>
#include <vector>

#include "platform/plugin_timeout.h"
#include "platform/qlibc_error.h"
#include "platform/root_path.h"
#include "platform/shell_command.h"
#include "platform/spawn_setup.h"
#include "utils/log.h"

extern char** environ;

struct QLIBPLUGIN {
    std::string module;
    std::string path;
    std::map<std::string, std::string> args;
};

namespace vorn {
namespace platform {
namespace {

constexpr int kDefaultTimeoutMs = QLIB_PLUGIN_TIMEOUT_SECONDS * 1000;

std::atomic<int> timeoutMs{kDefaultTimeoutMs};

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

bool IsPathChar(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_' ||
           c == '-' || c == '.';
}

// "net/gateway_change": relative, each component non-empty, not "." or "..", from a plain
// file-name alphabet, so the hook directory can only lie below the plug-in directory.
bool IsValidHookPath(const std::string& path) {
    std::string component;
    for (size_t i = 0; i <= path.size(); ++i) {
        if (i == path.size() || path[i] == '/') {
            if (component.empty() || component == "." || component == "..") {
                return false;
            }
            component.clear();
        } else if (IsPathChar(path[i])) {
            component += path[i];
        } else {
            return false;
        }
    }
    return true;
}

bool IsEnvName(const std::string& key) {
    if (key.empty() || (key[0] >= '0' && key[0] <= '9')) {
        return false;
    }
    return std::all_of(key.begin(), key.end(), [](char c) {
        return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
               c == '_';
    });
}

bool HasLineEnd(const std::string& value) {
    return value.find_first_of("\r\n") != std::string::npos;
}

std::string HookDirectory(const QLIBPLUGIN& plugin) {
    return "/etc/vorn/plugins/" + plugin.path + ".d";
}

// The caller's environment with the hook's arguments and PLUGIN_* put over it (no name twice).
std::vector<std::string> ScriptEnvironment(const QLIBPLUGIN& plugin, int action) {
    std::map<std::string, std::string> extra = plugin.args;
    extra["PLUGIN_MODULE"] = plugin.module;
    extra["PLUGIN_PATH"] = plugin.path;
    extra["PLUGIN_ACTION"] = std::to_string(action);
    std::vector<std::string> env;
    for (char** entry = environ; entry != nullptr && *entry != nullptr; ++entry) {
        const std::string text = *entry;
        if (extra.count(text.substr(0, text.find('='))) == 0) {
            env.push_back(text);
        }
    }
    for (const auto& pair : extra) {
        env.push_back(pair.first + "=" + pair.second);
    }
    return env;
}

// Executable regular files of the hook directory, by name. A missing directory has none.
bool ListScripts(const std::string& directory, std::vector<std::string>& names) {
    const std::string real = RootPath(directory);
    DIR* dir = opendir(real.c_str());
    if (dir == nullptr) {
        if (errno == ENOENT) {
            return true;
        }
        VORN_LOG(LOG_ERR, "Failed to open plugin directory [%s] errno [%d]", directory.c_str(),
                 errno);
        return false;
    }
    while (const dirent* entry = readdir(dir)) {
        const std::string name = entry->d_name;
        const std::string file = real + "/" + name;
        struct stat info;
        if (stat(file.c_str(), &info) == 0 && S_ISREG(info.st_mode) &&
            access(file.c_str(), X_OK) == 0) {
            names.push_back(name);
        }
    }
    closedir(dir);
    std::sort(names.begin(), names.end());
    return true;
}

// A script runs in its own process group, so that a timeout kills whatever it started.
class ScriptSpawn {
  public:
    ScriptSpawn() : attributes_(true) { actions_.Silence(STDIN_FILENO, O_RDONLY); }

    int Start(pid_t& pid, const std::string& program, char* const env[]) const {
        char* const argv[] = {const_cast<char*>(program.c_str()), nullptr};
        return posix_spawn(&pid, program.c_str(), actions_.Get(), attributes_.Get(), argv, env);
    }

  private:
    vorn::platform::SpawnAttributes attributes_;
    vorn::platform::SpawnActions actions_;
};

bool RunScript(const std::string& logical, char* const env[]) {
    static const ScriptSpawn spawn;
    pid_t pid = -1;
    const int error = spawn.Start(pid, RootPath(logical), env);
    if (error != 0) {
        VORN_LOG(LOG_ERR, "Failed to start plugin [%s] errno [%d]", logical.c_str(), error);
        return false;
    }
    int status = 0;
    if (!WaitUntil(pid, logical,
                   Deadline::clock::now() + std::chrono::milliseconds(timeoutMs.load()), status)) {
        return false;
    }
    if (WIFEXITED(status) && WEXITSTATUS(status) == 0) {
        return true;
    }
    if (WIFSIGNALED(status)) {
        VORN_LOG(LOG_ERR, "Plugin [%s] ended by signal [%d]", logical.c_str(), WTERMSIG(status));
    } else {
        VORN_LOG(LOG_ERR, "Plugin [%s] exited with [%d]", logical.c_str(), WEXITSTATUS(status));
    }
    return false;
}

int RunHook(const QLIBPLUGIN& plugin, int action) {
    const std::string directory = HookDirectory(plugin);
    std::vector<std::string> names;
    if (!ListScripts(directory, names)) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    if (names.empty()) {
        return 0;
    }
    std::vector<std::string> env = ScriptEnvironment(plugin, action);
    std::vector<char*> envp;
    for (std::string& entry : env) {
        envp.push_back(&entry[0]);
    }
    envp.push_back(nullptr);
    bool allPassed = true;
    for (const std::string& name : names) {
        allPassed = RunScript(directory + "/" + name, envp.data()) && allPassed;
    }
    return allPassed ? 0 : Fail(QLIBC_ERR_EXEC);
}

}  // namespace

void SetPluginTimeoutForTests(int milliseconds) {
    timeoutMs = milliseconds > 0 ? milliseconds : kDefaultTimeoutMs;
}

}  // namespace platform
}  // namespace vorn

extern "C" {

int QLIBPluginSDKInit(const char* module, const char* path, QLIBPLUGIN** handle) {
    using vorn::platform::Fail;
    if (module == nullptr || path == nullptr || handle == nullptr || module[0] == '\0' ||
        vorn::platform::HasLineEnd(module) || !vorn::platform::IsValidHookPath(path)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        *handle = new QLIBPLUGIN{module, path, {}};
        return 0;
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int QLIBPluginSetArg(QLIBPLUGIN* handle, const char* key, const char* value) {
    using vorn::platform::Fail;
    if (handle == nullptr || key == nullptr || value == nullptr ||
        !vorn::platform::IsEnvName(key) || vorn::platform::HasLineEnd(value)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        handle->args[key] = value;
        return 0;
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int QLIBPluginAction(int action, QLIBPLUGIN* handle) {
    using vorn::platform::Fail;
    if (handle == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        return vorn::platform::RunHook(*handle, action);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

void QLIBPluginExit(QLIBPLUGIN* handle) {
    delete handle;
}

}  // extern "C"
