#include "network/dhcp/dhcpd_config.h"

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

#include "platform/qlibc_error.h"
#include "platform/qlibc_file.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "utils/file.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/temp_file.h"

namespace vornnetwork {
namespace network {
namespace dhcp {
namespace {

using vornwireless::utils::TempFile;
using HashPtr = std::unique_ptr<QLIBSZHASH, decltype(&QLIBCSzHashFree)>;
using ListPtr = std::unique_ptr<QLIBSZLIST, decltype(&QLIBCSzListFree)>;

constexpr const char* kDirectory = "/etc/dhcpd";
constexpr size_t kNameBuffer = 4096;
constexpr const char* kInfoKeys[] = {"enable", "pxe", "url"};
constexpr const char* kWpadOption = "252";

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

bool IsServiceType(int type) {
    for (SERVICE_TYPE known : DhcpdConfig::kServiceTypes) {
        if (type == known) {
            return true;
        }
    }
    return false;
}

bool IsSubnet(SERVICE_TYPE type) {
    return type == SERVICE_TYPE_IPV4 || type == SERVICE_TYPE_IPV6;
}

bool AreServiceTypes(int types) {
    if ((types & ~SERVICE_TYPE_ALL) == 0) {
        return true;
    }
    VORN_LOG(LOG_ERR, "Bad service types [%d]", types);
    QLIBCErrSet(QLIBC_ERR_INVALID_ARG);
    return false;
}

// The part of an interface name that may go into a file name.
std::string FileInterfaceName(const std::string& ifname) {
    return ifname.substr(0, ifname.find_first_of("\r\n./\\;%"));
}

// A fixed-size text field, which may lack its terminating NUL.
template <size_t N>
std::string Field(const char (&field)[N]) {
    return std::string(field, strnlen(field, N));
}

template <size_t N>
bool SetField(char (&field)[N], const std::string& value) {
    if (value.size() >= N) {
        return false;
    }
    std::memset(field, 0, N);
    std::memcpy(field, value.data(), value.size());
    return true;
}

// Nothing that would end a value or a line, or that dnsmasq reads as quoting or a comment.
bool IsPlainValue(const std::string& value) {
    for (char c : value) {
        if (c <= ' ' || c > '~' || std::strchr(",\"#\\", c) != nullptr) {
            return false;
        }
    }
    return true;
}

template <size_t N>
bool IsPlainField(const char (&field)[N]) {
    return strnlen(field, N) < N && IsPlainValue(field);
}

bool AreFieldsPlain(const DHCPD_CONF& conf) {
    return IsPlainField(conf.start) && IsPlainField(conf.end) && IsPlainField(conf.domain) &&
           IsPlainField(conf.dns1) && IsPlainField(conf.dns2) && IsPlainField(conf.netmask) &&
           IsPlainField(conf.router) && IsPlainField(conf.boot);
}

// The label that ties a service's lines together. WPAD takes the interface's own: dnsmasq sets
// it for every request arriving there, whichever subnet answers.
std::string ServiceTag(const DHCPD_CONF& conf) {
    const std::string name = FileInterfaceName(Field(conf.ifname));
    const std::string index = std::to_string(conf.index);
    switch (conf.type) {
        case SERVICE_TYPE_IPV4:
            return name + index;
        case SERVICE_TYPE_IPV6:
            return name + "v6" + index;
        case SERVICE_TYPE_PXE:
            return name + "pxe";
        default:
            return Field(conf.ifname);
    }
}

bool MakeDirectory() {
    if (vornwireless::utils::CheckAndMakeDir(kDirectory, 0755) == 0) {
        return true;
    }
    QLIBCErrSet(QLIBC_ERR_FILE_IO);
    return false;
}

void RemoveTemporary(const std::string& path) {
    if (QLIBCFileExist(path.c_str()) > 0 && QLIBCSysUnlink(path.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to remove a temporary file: %s", path.c_str());
    }
}

bool PutInPlace(const std::string& tmpPath, const std::string& path) {
    if (QLIBCSysRename(tmpPath.c_str(), path.c_str()) == 0) {
        return true;
    }
    VORN_LOG(LOG_ERR, "Failed to rename file from \"%s\" to \"%s\"", tmpPath.c_str(), path.c_str());
    RemoveTemporary(tmpPath);
    QLIBCErrSet(QLIBC_ERR_FILE_IO);
    return false;
}

// Writes a service in dnsmasq's syntax; false on a write error or a type without lines.
bool WriteService(FILE* stream, const DHCPD_CONF& conf, const std::string& tag) {
    const char* t = tag.c_str();
    if (conf.type == SERVICE_TYPE_WPAD) {
        return conf.router[0] != '\0'
                   ? std::fprintf(stream, "dhcp-option=tag:%s,%s,%s\n", t, kWpadOption,
                                  conf.router) >= 0
                   : std::fprintf(stream, "dhcp-option=tag:%s,%s\n", t, kWpadOption) >= 0;
    }
    bool ok = std::fprintf(stream, "interface=%s\n", conf.ifname) >= 0 &&
              std::fprintf(stream, "dhcp-range=set:%s,%s,%s,%s,%d\n", t, conf.start, conf.end,
                           conf.netmask, conf.lease) >= 0;
    if (ok && conf.router[0] != '\0') {
        ok = std::fprintf(stream, "dhcp-option=tag:%s,%s,%s\n", t, "option:router", conf.router) >=
             0;
    }
    if (ok && conf.domain[0] != '\0') {
        ok = std::fprintf(stream, "dhcp-option=tag:%s,%s,%s\n", t, "option:domain-search",
                          conf.domain) >= 0 &&
             std::fprintf(stream, "dhcp-option=tag:%s,%s,%s\n", t, "option:domain-name",
                          conf.domain) >= 0;
    }
    if (ok && conf.dns1[0] != '\0') {
        const char* word =
            conf.type == SERVICE_TYPE_IPV6 ? "option6:dns-server" : "option:dns-server";
        ok = conf.dns2[0] != '\0'
                 ? std::fprintf(stream, "dhcp-option=tag:%s,%s,%s,%s\n", t, word, conf.dns1,
                                conf.dns2) >= 0
                 : std::fprintf(stream, "dhcp-option=tag:%s,%s,%s\n", t, word, conf.dns1) >= 0;
    }
    if (ok && conf.type == SERVICE_TYPE_PXE) {
        ok = std::fprintf(stream, "dhcp-boot=tag:%s,%s\n", t, conf.boot) >= 0 &&
             std::fputs("dhcp-vendorclass=set:pxe,PXEClient\n", stream) >= 0;
    }
    return ok;
}

std::vector<std::string> SplitValues(const std::string& text) {
    std::vector<std::string> values;
    size_t begin = 0;
    for (;;) {
        const size_t end = text.find_first_of(",\r\n", begin);
        values.push_back(text.substr(begin, end - begin));
        if (end == std::string::npos) {
            return values;
        }
        begin = end + 1;
    }
}

bool ParseLease(const std::string& text, int& lease) {
    if (text.empty() || text.find_first_not_of("0123456789") != std::string::npos) {
        return false;
    }
    errno = 0;
    const long value = std::strtol(text.c_str(), nullptr, 10);
    if (errno != 0 || value > INT_MAX) {
        return false;
    }
    lease = static_cast<int>(value);
    return true;
}

bool ParseRange(const std::vector<std::string>& v, DHCPD_CONF& conf) {
    return v.size() == 5 && SetField(conf.start, v[1]) && SetField(conf.end, v[2]) &&
           SetField(conf.netmask, v[3]) && ParseLease(v[4], conf.lease);
}

bool ParseOption(const std::vector<std::string>& v, DHCPD_CONF& conf) {
    if (v.size() < 2) {
        return false;
    }
    const std::string& word = v[1];
    if (word == kWpadOption) {
        return v.size() == 2 ? SetField(conf.router, "")
                             : v.size() == 3 && SetField(conf.router, v[2]);
    }
    if (word == "option:router") {
        return v.size() == 3 && SetField(conf.router, v[2]);
    }
    if (word == "option:domain-search" || word == "option:domain-name") {
        return v.size() == 3 && SetField(conf.domain, v[2]);
    }
    if (word == "option:dns-server" || word == "option6:dns-server") {
        return (v.size() == 3 || v.size() == 4) && SetField(conf.dns1, v[2]) &&
               SetField(conf.dns2, v.size() == 4 ? v[3] : "");
    }
    return true;  // an option this class does not manage
}

// One "key=value" line of a ".conf" file; lines of other keys are left alone.
bool ParseLine(const std::string& line, DHCPD_CONF& conf) {
    const size_t equals = line.find('=');
    if (equals == std::string::npos) {
        return true;
    }
    const std::string key = line.substr(0, equals);
    const std::vector<std::string> values = SplitValues(line.substr(equals + 1));
    if (key == "interface") {
        return values.size() == 1 && SetField(conf.ifname, values[0]);
    }
    if (key == "dhcp-range") {
        return ParseRange(values, conf);
    }
    if (key == "dhcp-option") {
        return ParseOption(values, conf);
    }
    if (key == "dhcp-boot") {
        return values.size() == 2 && SetField(conf.boot, values[1]);
    }
    return true;
}

// The services of a type on an interface beyond the first count are no longer wanted.
int RemoveConfFilesFrom(const std::string& ifname, SERVICE_TYPE type, int count) {
    const int last = IsSubnet(type) ? INT_MAX : 0;
    std::string path;
    for (int index = count; index <= last; ++index) {
        if (DhcpdConfig::getFileName(path, ifname, type, true, index) != 0 ||
            QLIBCFileExist(path.c_str()) <= 0) {
            break;
        }
        if (QLIBCSysUnlink(path.c_str()) != 0) {
            VORN_LOG(LOG_ERR, "Failed to remove %s", path.c_str());
            return Fail(QLIBC_ERR_FILE_IO);
        }
    }
    return 0;
}

// Copies of the records that belong in the files of ifname and type, numbered in order.
int SelectServices(const std::vector<DHCPD_CONF>& confs, const std::string& ifname,
                   SERVICE_TYPE type, std::vector<DHCPD_CONF>& selected) {
    const std::string name = FileInterfaceName(ifname);
    for (const DHCPD_CONF& conf : confs) {
        if (conf.type == type && FileInterfaceName(Field(conf.ifname)) == name) {
            selected.push_back(conf);
            selected.back().index = static_cast<uint32_t>(selected.size() - 1);
        }
    }
    if (!IsSubnet(type) && selected.size() > 1) {
        VORN_LOG(LOG_ERR, "%s has %u services of type [%d], one is allowed", ifname.c_str(),
                 static_cast<unsigned>(selected.size()), type);
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    return 0;
}

// The write stream of a new temporary file; null (logged, platform error set, the file removed)
// when it cannot be made or opened.
FILE* OpenTemporary(TempFile& temp) {
    if (!temp.Created()) {
        VORN_LOG(LOG_ERR, "Failed to create a temporary file: %s", temp.Logical().c_str());
        Fail(QLIBC_ERR_FILE_IO);
        return nullptr;
    }
    FILE* stream = temp.Open();
    if (stream == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to open a temporary file: %s", temp.Logical().c_str());
        RemoveTemporary(temp.Logical());
        Fail(QLIBC_ERR_FILE_IO);
    }
    return stream;
}

}  // namespace

const SERVICE_TYPE DhcpdConfig::kServiceTypes[4] = {SERVICE_TYPE_IPV4, SERVICE_TYPE_IPV6,
                                                    SERVICE_TYPE_PXE, SERVICE_TYPE_WPAD};

int DhcpdConfig::getFileName(std::string& out, const std::string& ifname, SERVICE_TYPE type,
                             bool conf, int index) {
    const std::string name = FileInterfaceName(ifname);
    if (index < 0 || !IsServiceType(type) || name.empty()) {
        VORN_LOG(LOG_ERR, "Bad interface [%s], service type [%d] or index [%d]", ifname.c_str(),
                 type, index);
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const char* n = name.c_str();
    const char* ext = conf ? "conf" : "info";
    char buffer[kNameBuffer] = {};
    int length = -1;
    switch (type) {
        case SERVICE_TYPE_IPV4:
            length = std::snprintf(buffer, sizeof(buffer), "/etc/dhcpd/dhcpd-%s-%s%d.%s", n, n,
                                   index, ext);
            break;
        case SERVICE_TYPE_IPV6:
            length = std::snprintf(buffer, sizeof(buffer), "/etc/dhcpd/dhcpd-%s-%sv6%d.%s", n, n,
                                   index, ext);
            break;
        case SERVICE_TYPE_PXE:
            length = std::snprintf(buffer, sizeof(buffer), "/etc/dhcpd/dhcpd-%s-pxe.%s", n, ext);
            break;
        default:
            length = std::snprintf(buffer, sizeof(buffer), "/etc/dhcpd/wpad-%s.%s", n, ext);
            break;
    }
    if (length < 0 || static_cast<size_t>(length) >= sizeof(buffer)) {
        VORN_LOG(LOG_ERR, "Interface name too long [%s]", ifname.c_str());
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    out = buffer;
    return 0;
}

int DhcpdConfig::getSubnetCntType(const std::string& ifname, SERVICE_TYPE type) {
    std::string confPath;
    std::string infoPath;
    if (getFileName(confPath, ifname, type, true, 0) != 0) {
        return -1;
    }
    const int last = IsSubnet(type) ? INT_MAX - 1 : 0;
    int count = 0;
    while (count <= last && getFileName(confPath, ifname, type, true, count) == 0 &&
           getFileName(infoPath, ifname, type, false, count) == 0 &&
           QLIBCFileExist(confPath.c_str()) > 0 && QLIBCFileExist(infoPath.c_str()) > 0) {
        ++count;
    }
    return count;
}

int DhcpdConfig::getSubnetCnt(const std::string& ifname, int types) {
    if (!AreServiceTypes(types)) {
        return -1;
    }
    int total = 0;
    for (SERVICE_TYPE type : kServiceTypes) {
        if ((types & type) == 0) {
            continue;
        }
        const int count = getSubnetCntType(ifname, type);
        if (count < 0) {
            return -1;
        }
        total += count;
    }
    return total;
}

bool DhcpdConfig::isEnabledFile(const std::string& path) {
    char value[sizeof("yes")] = {};
    return QLIBCFileGetKeyValue(path.c_str(), "enable", value, sizeof(value), 0) == 1 &&
           std::strcmp(value, "yes") == 0;
}

bool DhcpdConfig::isEnabledType(const std::string& ifname, SERVICE_TYPE type) {
    const int count = getSubnetCntType(ifname, type);
    std::string path;
    for (int index = 0; index < count; ++index) {
        if (getFileName(path, ifname, type, false, index) == 0 && isEnabledFile(path)) {
            return true;
        }
    }
    return false;
}

bool DhcpdConfig::isEnabled(const std::string& ifname, int types) {
    if (!AreServiceTypes(types)) {
        return false;
    }
    for (SERVICE_TYPE type : kServiceTypes) {
        if ((types & type) != 0 && isEnabledType(ifname, type)) {
            return true;
        }
    }
    return false;
}

int DhcpdConfig::loadConfFile(DHCPD_CONF& conf, const std::string& path) {
    std::string text;
    if (!vorn::platform::ReadTextFile(vorn::platform::RootPath(path), text)) {
        VORN_LOG(LOG_ERR, "Failed to read %s", path.c_str());
        return -1;
    }
    for (const std::string& line : vorn::platform::SplitLines(text)) {
        if (!ParseLine(line, conf)) {
            VORN_LOG(LOG_ERR, "Malformed line in %s: %.64s", path.c_str(), line.c_str());
            return Fail(QLIBC_ERR_FORMAT);
        }
    }
    return 0;
}

int DhcpdConfig::loadConfType(std::vector<DHCPD_CONF>& confs, const std::string& ifname,
                              SERVICE_TYPE type) {
    const int count = getSubnetCntType(ifname, type);
    if (count < 0) {
        return -1;
    }
    std::vector<DHCPD_CONF> loaded(static_cast<size_t>(count));
    std::string path;
    for (int index = 0; index < count; ++index) {
        DHCPD_CONF& conf = loaded[static_cast<size_t>(index)];
        conf.index = static_cast<uint32_t>(index);
        conf.type = type;
        if (!SetField(conf.ifname, ifname)) {
            VORN_LOG(LOG_ERR, "Interface name too long [%s]", ifname.c_str());
            return Fail(QLIBC_ERR_INVALID_ARG);
        }
        if (getFileName(path, ifname, type, true, index) != 0 || loadConfFile(conf, path) != 0) {
            return -1;
        }
    }
    confs.insert(confs.end(), loaded.begin(), loaded.end());
    return count;
}

int DhcpdConfig::loadConf(std::vector<DHCPD_CONF>& confs, const std::string& ifname, int types) {
    if (!AreServiceTypes(types)) {
        return -1;
    }
    std::vector<DHCPD_CONF> loaded;
    for (SERVICE_TYPE type : kServiceTypes) {
        if ((types & type) != 0 && loadConfType(loaded, ifname, type) < 0) {
            return -1;
        }
    }
    confs.insert(confs.end(), loaded.begin(), loaded.end());
    return static_cast<int>(loaded.size());
}

int DhcpdConfig::saveConfFile(std::string& tmpPath, const DHCPD_CONF& conf,
                              const std::string& tag) {
    const std::string ifname = Field(conf.ifname);
    std::string path;
    const int index = conf.index > INT_MAX ? -1 : static_cast<int>(conf.index);
    if (getFileName(path, ifname, conf.type, true, index) != 0) {
        return -1;
    }
    if (!vornwireless::utils::IsValidInterfaceName(ifname) || !IsPlainValue(tag) || tag.empty() ||
        !AreFieldsPlain(conf) || conf.lease < 0) {
        VORN_LOG(LOG_ERR, "Bad settings for %s", path.c_str());
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    if (!MakeDirectory()) {
        return -1;
    }
    TempFile temp(path);
    FILE* stream = OpenTemporary(temp);
    if (stream == nullptr) {
        return -1;
    }
    // A write error (a full disk) may show only when the buffered data is flushed.
    const bool written = WriteService(stream, conf, tag);
    if (!temp.Close() || !written) {
        VORN_LOG(LOG_ERR, "Failed to write a temporary file: %s", temp.Logical().c_str());
        RemoveTemporary(temp.Logical());
        return Fail(QLIBC_ERR_FILE_IO);
    }
    tmpPath = temp.Logical();
    return 0;
}

int DhcpdConfig::saveConfType(const std::vector<DHCPD_CONF>& confs, const std::string& ifname,
                              SERVICE_TYPE type) {
    std::string path;
    std::vector<DHCPD_CONF> selected;
    if (getFileName(path, ifname, type, true, 0) != 0 ||
        SelectServices(confs, ifname, type, selected) != 0) {
        return -1;
    }
    // (temporary, final) paths: every file is complete before the first one is replaced.
    std::vector<std::pair<std::string, std::string>> files;
    int error = QLIBC_ERR_NONE;
    for (const DHCPD_CONF& conf : selected) {
        std::string tmpPath;
        if (getFileName(path, ifname, type, true, static_cast<int>(conf.index)) != 0 ||
            saveConfFile(tmpPath, conf, ServiceTag(conf)) != 0) {
            error = QLIBCErrGet();
            break;
        }
        files.emplace_back(tmpPath, path);
    }
    for (const auto& file : files) {
        if (error != QLIBC_ERR_NONE) {
            RemoveTemporary(file.first);
        } else if (!PutInPlace(file.first, file.second)) {
            error = QLIBC_ERR_FILE_IO;
        }
    }
    if (error != QLIBC_ERR_NONE) {
        return Fail(error);
    }
    if (RemoveConfFilesFrom(ifname, type, static_cast<int>(selected.size())) != 0) {
        return -1;
    }
    return static_cast<int>(selected.size());
}

int DhcpdConfig::saveConf(const std::vector<DHCPD_CONF>& confs, const std::string& ifname,
                          int types) {
    if (!AreServiceTypes(types)) {
        return -1;
    }
    int total = 0;
    for (SERVICE_TYPE type : kServiceTypes) {
        if ((types & type) == 0) {
            continue;
        }
        const int written = saveConfType(confs, ifname, type);
        if (written < 0) {
            return -1;
        }
        total += written;
    }
    return total;
}

int DhcpdConfig::loadInfo(QLIBSZHASH* hash, const std::string& ifname, SERVICE_TYPE type,
                          int index) {
    std::string path;
    if (hash == nullptr) {
        VORN_LOG(LOG_ERR, "Null hash");
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    if (getFileName(path, ifname, type, false, index) != 0) {
        return -1;
    }
    ListPtr keys(QLIBCSzListAlloc(3), QLIBCSzListFree);
    for (const char* key : kInfoKeys) {
        if (keys == nullptr || QLIBCSzListAdd(keys.get(), key) != 0) {
            VORN_LOG(LOG_ERR, "Failed to allocate memory");
            return Fail(QLIBC_ERR_NO_MEMORY);
        }
    }
    QLIBSZHASH* target = hash;
    const int count = QLIBCFileGetKeys(path.c_str(), keys.get(), &target, "=");
    if (count < 0) {
        VORN_LOG(LOG_ERR, "Failed to read %s", path.c_str());
    }
    return count;
}

int DhcpdConfig::saveInfo(QLIBSZHASH* hash, const std::string& ifname, SERVICE_TYPE type,
                          int index) {
    std::string path;
    std::string tmpPath;
    if (getFileName(path, ifname, type, false, index) != 0 ||
        saveInfoFile(tmpPath, hash, path) != 0) {
        return -1;
    }
    return PutInPlace(tmpPath, path) ? 0 : -1;
}

int DhcpdConfig::saveInfoFile(std::string& tmpPath, QLIBSZHASH* hash, const std::string& path) {
    if (hash == nullptr || QLIBCSzHashGetValue(hash, "enable") == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to write %s: \"enable\" key is not found", path.c_str());
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    HashPtr info(QLIBCSzHashAlloc(3), QLIBCSzHashFree);
    for (const char* key : kInfoKeys) {
        const char* value = QLIBCSzHashGetValue(hash, key);
        if (info == nullptr ||
            (value != nullptr && QLIBCSzHashSetValue(info.get(), key, value) != 0)) {
            VORN_LOG(LOG_ERR, "Failed to allocate memory");
            return Fail(QLIBC_ERR_NO_MEMORY);
        }
    }
    if (!MakeDirectory()) {
        return -1;
    }
    TempFile temp(path);
    FILE* stream = OpenTemporary(temp);
    if (stream == nullptr) {
        return -1;
    }
    const bool written = QLIBCFileHash2File(stream, nullptr, info.get(), "%s=\"%s\"\n") == 0;
    if (!temp.Close() || !written) {
        VORN_LOG(LOG_ERR, "Failed to write key-value pairs to a temporary file: %s",
                 temp.Logical().c_str());
        RemoveTemporary(temp.Logical());
        return Fail(QLIBC_ERR_FILE_IO);
    }
    tmpPath = temp.Logical();
    return 0;
}

}  // namespace dhcp
}  // namespace network
}  // namespace vornnetwork
