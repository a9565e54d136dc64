#include "network/module/cvscanner.h"

#include <arpa/inet.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "platform/qlibc_container.h"
#include "platform/qlibc_error.h"
#include "platform/qlibc_file.h"
#include "platform/qlibc_str.h"
#include "platform/root_path.h"
#include "platform/vorn_net.h"
#include "utils/log.h"
#include "utils/mac_address.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr const char* kDumpFile = "/tmp/vorncv.list.tmp";
constexpr const char* kListFile = "/tmp/linkyard_cvscanner_list.tmp";
constexpr int kMaxHosts = 1024;
constexpr std::size_t kMaxLineLength = 1024;
constexpr std::size_t kFieldCount = 5;
constexpr long kMinModel = 240;

struct ListDeleter {
    void operator()(QLIBSZLIST* list) const { QLIBCSzListFree(list); }
};
using StringList = std::unique_ptr<QLIBSZLIST, ListDeleter>;

struct FileCloser {
    void operator()(FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<FILE, FileCloser>;

// Up to kMaxHosts lines without their ends; a line longer than kMaxLineLength is dropped whole.
void ReadLines(FILE* file, QLIBSZLIST* lines) {
    char buffer[kMaxLineLength + 2];
    bool partial = false;
    while (QLIBCSzListCount(lines) < kMaxHosts &&
           std::fgets(buffer, sizeof(buffer), file) != nullptr) {
        std::size_t length = std::strlen(buffer);
        const bool ended = (length > 0 && buffer[length - 1] == '\n') || std::feof(file);
        if (!partial && ended) {
            while (length > 0 && (buffer[length - 1] == '\n' || buffer[length - 1] == '\r')) {
                buffer[--length] = '\0';
            }
            QLIBCSzListAdd(lines, buffer);
        }
        partial = !ended;
    }
}

std::vector<std::string> SplitFields(const std::string& line) {
    std::vector<char> text(line.begin(), line.end());
    text.push_back('\0');
    std::vector<std::string> fields;
    char* cursor = text.data();
    while (const char* field = QLIBCStrSep(&cursor, ",")) {
        fields.emplace_back(field);
    }
    return fields;
}

bool IsHostAddress(const std::string& ip, const std::string& mac) {
    in_addr parsed;
    const vornwireless::utils::MacAddress formal(mac);
    return inet_pton(AF_INET, ip.c_str(), &parsed) == 1 && formal.IsFormalized() &&
           formal.ToString() == mac;
}

}  // namespace

std::atomic<bool> CVScanner::scanning_(false);

CVScanner* CVScanner::Inst() {
    static CVScanner* const instance = new CVScanner();
    return instance;
}

Json::Value CVScanner::GetData() {
    BoardcastFindHost();
    ReadFHOSTListFile();
    Json::Value list = GetClientList();
    EraseList();
    return list;
}

void CVScanner::BoardcastFindHost() {
    if (scanning_.exchange(true)) {
        return;
    }
    if (pthread_create(&thread, nullptr, WaitBoardcastFinish, nullptr) != 0) {
        VORN_LOG(LOG_ERR, "failed to create thread");
        scanning_ = false;
    }
}

void* CVScanner::WaitBoardcastFinish(void*) {
    if (VORNFHOSTDumpHost() != 0) {
        VORN_LOG(LOG_ERR, "VORNFHOSTDumpHost() failed!! vornerr=[0x%04X]", QLIBCErrGet());
    }
    pthread_detach(pthread_self());
    scanning_ = false;
    return nullptr;
}

int CVScanner::ReadFHOSTListFile() {
    const StringList lines(QLIBCSzListAlloc(kMaxHosts));
    if (lines == nullptr) {
        VORN_LOG(LOG_ERR, "Out of memory");
        return -1;
    }
    const bool dumped = QLIBCFileExist(kDumpFile) == 1;
    if (!dumped && QLIBCFileExist(kListFile) != 1) {
        return 0;
    }
    if (dumped && VORNFileCopy(kDumpFile, kListFile) != 0) {
        VORN_LOG(LOG_ERR, "failed to copy (%s) to (%s)", kDumpFile, kListFile);
    }
    const File file(std::fopen(vorn::platform::RootPath(kListFile).c_str(), "re"));
    if (file == nullptr) {
        const int error = errno;
        VORN_LOG(LOG_ERR, "cvscanner failed to open %s, error (%d):(%s)", kListFile, error,
                 std::strerror(error));
        return -1;
    }
    ReadLines(file.get(), lines.get());
    for (int i = 0; i < QLIBCSzListCount(lines.get()); ++i) {
        AppendHost(QLIBCSzListGet(lines.get(), i));
    }
    return 0;
}

void CVScanner::AppendHost(const std::string& line) {
    const std::vector<std::string> fields = SplitFields(line);
    if (fields.size() < kFieldCount) {
        VORN_LOG(LOG_WARNING, "field number < 5");
        return;
    }
    if (std::strtol(fields[0].c_str(), nullptr, 10) == 0) {
        VORN_LOG(LOG_WARNING, "model number == 0");
        return;
    }
    if (std::strtol(fields[1].c_str(), nullptr, 10) < kMinModel) {
        return;
    }
    const std::string& ip = fields[3];
    const std::string& mac = fields[4];
    if (!IsHostAddress(ip, mac)) {
        VORN_LOG(LOG_WARNING, "cvscanner skips a host with a bad address [%s]", line.c_str());
        return;
    }
    Json::Value obj(Json::objectValue);
    obj["deviceType"] = "nas";
    obj["modelName"] = fields[1];
    obj["manufacturer"] = "Tessarin";
    obj["friendlyName"] = fields[2];
    obj["ipAddr"] = ip;
    obj["macAddr"] = mac;
    if (!UpdateKeysByMac(mac, obj, true)) {
        VORN_LOG(LOG_ERR, "failed to update key for cv scanner");
    }
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
