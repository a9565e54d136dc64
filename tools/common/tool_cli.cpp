#include "common/tool_cli.h"

#include <syslog.h>

#include <algorithm>
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

bool OneCommandGiven(const char* name, const std::vector<const CLI::Option*>& commands) {
    const auto given = std::count_if(commands.begin(), commands.end(),
                                     [](const CLI::Option* option) { return option->count() > 0; });
    if (given != 1) {
        std::fprintf(stderr, "%s: give exactly one command (--help lists them)\n", name);
        return false;
    }
    return true;
}

int ReportReady(bool up) {
    std::printf("%s\n", up ? "ready" : "not ready");
    return up ? 0 : 1;
}

int FinishCall(const char* name, const char* option, int result, const Json::Value* answer,
               bool compact) {
    if (result < 0) {
        std::fprintf(stderr, "%s: %s failed (%d)\n", name, option, result);
        return ExitStatus(result);
    }
    if (answer != nullptr) {
        PrintJson(*answer, compact);
    }
    return 0;
}

}  // namespace tools
}  // namespace vorn
