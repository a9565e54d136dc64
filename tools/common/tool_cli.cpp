#include "common/tool_cli.h"

#include <syslog.h>

#include <cstdio>
#include <memory>

#include "platform/root_path.h"
#include "utils/json_text.h"
#include "utils/log.h"

namespace vorn {
namespace tools {

std::string OperandFormatter::make_option_opts(const CLI::Option* option) const {
    return option->get_type_name().empty() ? "" : " " + option->get_type_name();
}

void SetUpApp(CLI::App& app, const char* name, const char* version) {
    app.name(name);
    app.set_version_flag("--version", std::string(name) + " " + version);
    app.formatter(std::make_shared<OperandFormatter>());
    app.get_formatter()->column_width(40);
}

bool ParseCommandLine(CLI::App& app, int argc, char** argv, const char* name, int& status) {
    try {
        app.parse(argc, argv);
        return true;
    } catch (const CLI::Success& e) {
        status = app.exit(e);
    } catch (const CLI::ParseError& e) {
        std::fprintf(stderr,
                     "%s: unknown command or wrong arguments: %s\nRun with --help for the "
                     "commands.\n",
                     name, e.what());
        status = 2;
    }
    return false;
}

void SendLogToStderr(const char* name) {
    vorn::platform::PrefixPathWithRoot();
    openlog(name, LOG_PID, LOG_USER);
    vorn::log::SetSink([name](int priority, const std::string& line) {
        vorn::log::SyslogSink(priority, line);
        if (priority <= LOG_WARNING) {
            std::fprintf(stderr, "%s: %s\n", name, line.c_str());
        }
    });
}

void PrintJson(const Json::Value& data, bool compact) {
    std::printf("%s", compact ? (vornwireless::utils::CompactJson(data) + "\n").c_str()
                              : vornwireless::utils::StyledJson(data).c_str());
}

int ExitStatus(int result) {
    if (result >= 0) {
        return 0;
    }
    return result < -125 ? 125 : -result;
}

}  // namespace tools
}  // namespace vorn
