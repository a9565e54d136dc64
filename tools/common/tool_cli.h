#ifndef VORN_TOOLS_COMMON_TOOL_CLI_H
#define VORN_TOOLS_COMMON_TOOL_CLI_H

#include <json/json.h>

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

// What the command-line tools share: their help layout, output and exit status.
namespace vorn {
namespace tools {

// Shows each option's operands as the tool's table names them, nothing added.
class OperandFormatter : public CLI::Formatter {
  public:
    std::string make_option_opts(const CLI::Option* option) const override;
};

// A CLI11 app named name with the tools' help layout and --version.
void SetUpApp(CLI::App& app, const char* name, const char* version);
// Parses the command line; false with the exit status in status (0 after --help or --version, 2
// for a usage error, explained on standard error).
bool ParseCommandLine(CLI::App& app, int argc, char** argv, const char* name, int& status);
// The library's log lines go to syslog as name, and warnings and errors also to standard error:
// the service's error text is the user's answer.
void SendLogToStderr(const char* name);
// An answer on standard output: indented, or one line.
void PrintJson(const Json::Value& data, bool compact);
// A method's result as an exit status: 0, or its error number (at most 125).
int ExitStatus(int result);
// Exactly one of the commands' options was given; otherwise says so on standard error.
bool OneCommandGiven(const char* name, const std::vector<const CLI::Option*>& commands);
// --ready's answer, "ready" or "not ready"; the exit status.
int ReportReady(bool up);
// The end of a call: "NAME: OPTION failed (N)" and the error's exit status, or 0 after printing
// the answer when the method has one.
int FinishCall(const char* name, const char* option, int result, const Json::Value* answer,
               bool compact);

}  // namespace tools
}  // namespace vorn

#endif
