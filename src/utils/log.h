#ifndef VORN_UTILS_LOG_H
#define VORN_UTILS_LOG_H

#include <syslog.h>

#include <functional>
#include <string>

namespace vorn {
namespace log {

// Receives every finished line ("file.cpp:42 text") with its syslog priority.
using Sink = std::function<void(int priority, const std::string& line)>;

// Replaces the process-wide sink; an empty sink restores syslog.
void SetSink(Sink sink);

// The default sink, and the one a daemon in the foreground uses.
void SyslogSink(int priority, const std::string& line);
void SyslogAndStderrSink(int priority, const std::string& line);

// Formats "<file>:<line> " followed by the message and hands it to the sink.
void Write(int priority, const char* file, int line, const char* format, ...)
    __attribute__((format(printf, 4, 5)));

// The base name of a source path, for compilers without __FILE_NAME__.
constexpr const char* BaseName(const char* path) {
    const char* base = path;
    for (const char* p = path; *p != '\0'; ++p) {
        if (*p == '/') {
            base = p + 1;
        }
    }
    return base;
}

}  // namespace log
}  // namespace vorn

#if defined(__FILE_NAME__)
#define VORN_FILE_NAME __FILE_NAME__
#else
#define VORN_FILE_NAME ::vorn::log::BaseName(__FILE__)
#endif

// VORN_LOG(LOG_ERR, "Failed to open [%s]", path): one line, prefixed with the source file and line.
#define VORN_LOG(priority, ...) \
    ::vorn::log::Write((priority), VORN_FILE_NAME, __LINE__, __VA_ARGS__)

#endif
