#include "utils/service_daemon.h"

#include <signal.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>

#include "platform/root_path.h"
#include "utils/create_pid_file.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {

ServiceDaemon::ServiceDaemon(const char* name, const char* description)
    : name_(name), description_(description), pidPath_("/var/run/" + name_ + ".pid") {}

ServiceDaemon::~ServiceDaemon() {
    if (pidFile_ >= 0) {
        unlink(vorn::platform::RootPath(pidPath_).c_str());
        close(pidFile_);
    }
}

void ServiceDaemon::Usage(FILE* out) const {
    std::fprintf(out,
                 "Usage: %s [--foreground] [--help] [--version]\n%s\n"
                 "  --foreground  stay attached and copy log lines to stderr\n"
                 "  --help        show this text\n"
                 "  --version     show the version\n"
                 "\n"
                 "Stops on SIGTERM or SIGINT. Paths and programs live under $VORN_ROOT when set.\n",
                 name_.c_str(), description_.c_str());
}

int ServiceDaemon::Start(int argc, char** argv) {
    bool foreground = false;
    for (int i = 1; i < argc; ++i) {
        if (std::strcmp(argv[i], "--foreground") == 0) {
            foreground = true;
        } else if (std::strcmp(argv[i], "--help") == 0) {
            Usage(stdout);
            return 0;
        } else if (std::strcmp(argv[i], "--version") == 0) {
            std::printf("%s 5.0.0\n", name_.c_str());
            return 0;
        } else {
            std::fprintf(stderr, "%s: unknown argument '%s'\n", name_.c_str(), argv[i]);
            Usage(stderr);
            return 2;
        }
    }

    openlog(name_.c_str(), LOG_PID, LOG_DAEMON);
    if (foreground) {
        vorn::log::SetSink(vorn::log::SyslogAndStderrSink);
    } else if (daemon(0, 0) != 0) {
        std::perror((name_ + ": daemon").c_str());
        return 1;
    }
    signal(SIGPIPE, SIG_IGN);
    vorn::platform::PrefixPathWithRoot();

    pidFile_ = CreatePidFile(pidPath_);
    if (pidFile_ < 0) {
        std::fprintf(stderr, "%s: cannot take %s: another %s is running\n", name_.c_str(),
                     pidPath_.c_str(), name_.c_str());
        VORN_LOG(LOG_ERR, "Another instance holds %s", pidPath_.c_str());
        return 1;
    }
    return -1;
}

}  // namespace utils
}  // namespace vornwireless
