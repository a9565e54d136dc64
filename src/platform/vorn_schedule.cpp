#include "platform/vorn_schedule.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <mutex>
#include <string>
#include <vector>

#include "platform/qlibc_error.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "utils/log.h"

namespace {

const char kCrontab[] = "/var/spool/cron/crontabs/root";
constexpr int kEveryDay = 0x7f;
constexpr int kTimeFields = 5;

// Read-modify-write of the one file, from any thread.
std::mutex crontabMutex;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

bool IsBlank(char c) {
    return c == ' ' || c == '\t';
}

// Why cron would not run command as given, or null when it would.
const char* CommandFault(const char* command) {
    const std::string text = command;
    if (text.empty() || IsBlank(text.front()) || IsBlank(text.back())) {
        return "is empty or has surrounding blanks";
    }
    if (text.find_first_of("\r\n") != std::string::npos) {
        return "holds a line break";
    }
    if (text.find('%') != std::string::npos) {
        return "holds '%', which cron turns into a line break";
    }
    return nullptr;
}

std::string DayField(int dayMask) {
    if (dayMask == kEveryDay) {
        return "*";
    }
    std::string field;
    for (int day = 0; day < 7; ++day) {
        if (dayMask & (1 << day)) {
            field += (field.empty() ? "" : ",") + std::to_string(day);
        }
    }
    return field;
}

std::string HourField(int hourBegin, int hourEnd) {
    const std::string begin = std::to_string(hourBegin);
    return hourBegin == hourEnd ? begin : begin + "-" + std::to_string(hourEnd);
}

// The command of a crontab line ("" for comments, settings and lines without one).
std::string CommandOfLine(const std::string& line) {
    size_t at = 0;
    const auto skipBlanks = [&] {
        while (at < line.size() && IsBlank(line[at])) {
            ++at;
        }
    };
    skipBlanks();
    if (at == line.size() || line[at] == '#') {
        return "";
    }
    const int fields = line[at] == '@' ? 1 : kTimeFields;
    for (int field = 0; field < fields; ++field) {
        while (at < line.size() && !IsBlank(line[at])) {
            ++at;
        }
        skipBlanks();
    }
    return line.substr(at);
}

// Replaces the crontab with lines, or leaves it when they are what it holds.
int WriteCrontab(const std::vector<std::string>& lines) {
    std::string text;
    for (const auto& line : lines) {
        text += line + "\n";
    }
    const std::string real = vorn::platform::RootPath(kCrontab);
    if (!vorn::platform::WriteFileAtomically(real, text)) {
        VORN_LOG(LOG_ERR, "Failed to write [%s] errno [%d]", kCrontab, errno);
        return -1;
    }
    // cron ignores a crontab others may read; the file is ours after the rename.
    const int fd = open(real.c_str(), O_RDONLY | O_NOFOLLOW | O_CLOEXEC);
    const bool restricted = fd >= 0 && fchmod(fd, 0600) == 0;
    if (fd >= 0) {
        close(fd);
    }
    if (!restricted) {
        VORN_LOG(LOG_ERR, "Failed to set the mode of [%s] errno [%d]", kCrontab, errno);
        return Fail(QLIBC_ERR_FILE_IO);
    }
    return 0;
}

// The crontab's lines, or false when it cannot be read (a missing one has none).
bool ReadCrontab(std::vector<std::string>& lines) {
    std::string text;
    if (!vorn::platform::ReadTextFile(vorn::platform::RootPath(kCrontab), text)) {
        if (QLIBCErrGet() != QLIBC_ERR_NOT_FOUND) {
            VORN_LOG(LOG_ERR, "Failed to read [%s]", kCrontab);
            return false;
        }
        text.clear();
    }
    lines = vorn::platform::SplitLines(text);
    return true;
}

// Puts entry in place of the first line of command (at the end when there is none) and drops
// the other lines of command; an empty entry only drops. True when anything changed.
bool ReplaceCommandLine(std::vector<std::string>& lines, const std::string& command,
                        const std::string& entry) {
    std::vector<std::string> kept;
    bool placed = entry.empty();
    bool changed = false;
    for (const auto& line : lines) {
        if (CommandOfLine(line) != command) {
            kept.push_back(line);
            continue;
        }
        changed = changed || line != entry || placed;
        if (!placed) {
            kept.push_back(entry);
            placed = true;
        }
    }
    if (!placed) {
        kept.push_back(entry);
        changed = true;
    }
    lines.swap(kept);
    return changed;
}

}  // namespace

extern "C" {

int VORNScheduleSet(const char* command, int dayMask, int hourBegin, int hourEnd, int minute) {
    if (command == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    if (const char* fault = CommandFault(command)) {
        VORN_LOG(LOG_ERR, "Refused schedule: the command %s", fault);
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    if (dayMask <= 0 || dayMask > kEveryDay || hourBegin < 0 || hourEnd > 23 ||
        hourBegin > hourEnd || minute < 0 || minute > 59) {
        VORN_LOG(LOG_ERR, "Refused schedule of [%s]: days [%d] hours [%d-%d] minute [%d]", command,
                 dayMask, hourBegin, hourEnd, minute);
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string entry = std::to_string(minute) + " " + HourField(hourBegin, hourEnd) +
                              " * * " + DayField(dayMask) + " " + command;
    const std::lock_guard<std::mutex> lock(crontabMutex);
    std::vector<std::string> lines;
    if (!ReadCrontab(lines)) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    return ReplaceCommandLine(lines, command, entry) ? WriteCrontab(lines) : 0;
}

int VORNScheduleRemove(const char* command) {
    if (command == nullptr || command[0] == '\0') {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::lock_guard<std::mutex> lock(crontabMutex);
    std::vector<std::string> lines;
    if (!ReadCrontab(lines)) {
        return Fail(QLIBC_ERR_FILE_IO);
    }
    return ReplaceCommandLine(lines, command, "") ? WriteCrontab(lines) : 0;
}

}  // extern "C"
