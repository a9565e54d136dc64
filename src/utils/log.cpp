#include "utils/log.h"

#include <pthread.h>

#include <cstdarg>
#include <cstdio>
#include <mutex>
#include <utility>
#include <vector>

namespace vorn {
namespace log {
namespace {

std::mutex& SinkMutex() {
    static std::mutex mutex;
    // A child forked while another thread logs would find the lock held for ever.
    static const int forkSafe =
        pthread_atfork([] { mutex.lock(); }, [] { mutex.unlock(); }, [] { mutex.unlock(); });
    static_cast<void>(forkSafe);
    return mutex;
}

Sink& CurrentSink() {
    static Sink sink;
    return sink;
}

}  // namespace

void SetSink(Sink sink) {
    std::lock_guard<std::mutex> lock(SinkMutex());
    CurrentSink() = std::move(sink);
}

void SyslogSink(int priority, const std::string& line) {
    syslog(priority, "%s", line.c_str());
}

void SyslogAndStderrSink(int priority, const std::string& line) {
    SyslogSink(priority, line);
    std::fprintf(stderr, "<%d> %s\n", priority, line.c_str());
}

void Write(int priority, const char* file, int line, const char* format, ...) {
    char prefix[256];
    std::snprintf(prefix, sizeof(prefix), "%s:%d ", file, line);

    va_list args;
    va_start(args, format);
    va_list copy;
    va_copy(copy, args);
    const int length = std::vsnprintf(nullptr, 0, format, copy);
    va_end(copy);
    std::string text(prefix);
    if (length > 0) {
        std::vector<char> body(static_cast<size_t>(length) + 1);
        std::vsnprintf(body.data(), body.size(), format, args);
        text.append(body.data(), static_cast<size_t>(length));
    }
    va_end(args);

    std::lock_guard<std::mutex> lock(SinkMutex());
    if (CurrentSink()) {
        CurrentSink()(priority, text);
    } else {
        SyslogSink(priority, text);
    }
}

}  // namespace log
}  // namespace vorn
