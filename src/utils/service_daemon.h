#ifndef VORN_UTILS_SERVICE_DAEMON_H
#define VORN_UTILS_SERVICE_DAEMON_H

#include <string>

namespace vornwireless {
namespace utils {

// What both daemons do around their service loop: the command line (--foreground, --help,
// --version), the syslog ident, detaching, the root's program folders on PATH and the
// single-instance pid file "/var/run/NAME.pid", removed again when the object goes.
class ServiceDaemon {
  public:
    // description: the lines of the help text between the usage line and the options.
    ServiceDaemon(const char* name, const char* description);
    ~ServiceDaemon();
    ServiceDaemon(const ServiceDaemon&) = delete;
    ServiceDaemon& operator=(const ServiceDaemon&) = delete;

    // -1 when the daemon is to go on (detached, or in the foreground with log lines copied to
    // stderr, and holding the pid file); otherwise the exit status the command line or a running
    // instance calls for.
    int Start(int argc, char** argv);

  private:
    void Usage(FILE* out) const;

    std::string name_;
    std::string description_;
    std::string pidPath_;
    int pidFile_ = -1;
};

}  // namespace utils
}  // namespace vornwireless

#endif
