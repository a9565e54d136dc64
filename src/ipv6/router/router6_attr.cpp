#include "ipv6/router/router6_attr.h"

#include <arpa/inet.h>

#include <cstdlib>
#include <memory>

#include "platform/qlibc_file.h"
#include "platform/vorn_ipv6.h"
#include "utils/dbus_client.h"
#include "utils/file.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {
namespace {

using vornwireless::utils::IsValidInterfaceName;

const char kConfigDir[] = "/etc/sysconfig/networking";
const char kConfigPrefix[] = "/etc/sysconfig/networking/ipv6-";
const char kTunnelPrefix[] = "6in4-";
const char kSectionFormat[] = "\t%s=%s\n";
constexpr int kHashSize = 1024;
constexpr int kNameSize = 1024;

using HashPtr = std::unique_ptr<QLIBSZHASH, void (*)(QLIBSZHASH*)>;

// A hash for the settings of wan (converted: its interface); null (logged) for a name that
// cannot name a file, or no memory.
HashPtr SettingsHash(const std::string& wan, const std::string& converted) {
    if (!IsValidInterfaceName(converted)) {
        VORN_LOG(LOG_ERR, "Invalid wan interface [%s]", wan.c_str());
        return HashPtr(nullptr, QLIBCSzHashFree);
    }
    HashPtr hash(QLIBCSzHashAlloc(kHashSize), QLIBCSzHashFree);
    if (hash == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to allocate PQLIBSZHASH");
    }
    return hash;
}

std::string Value(const QLIBSZHASH* hash, const char* key) {
    const char* value = QLIBCSzHashGetValue(hash, key);
    return value != nullptr ? value : "";
}

int Put(QLIBSZHASH* hash, const char* key, const std::string& value) {
    return QLIBCSzHashSetValue(hash, key, value.c_str()) == 0 ? 0 : 1;
}

// Empty texts are left out of the JSON form.
void PutIfSet(Json::Value& object, const char* key, const std::string& value) {
    if (!value.empty()) {
        object[key] = value;
    }
}

// A section of the file and the word its messages name it by.
struct Section {
    const char* name;
    const char* word;
};

const Section kConf = {"conf", "config"};
const Section kAddr = {"addr", "address"};
const Section kPref = {"lan", "prefix"};

int AddSection(const std::string& file, QLIBSZHASH* hash, int failedPuts, const Section& section) {
    if (failedPuts != 0) {
        VORN_LOG(LOG_ERR, "Failed to generate %s section", section.word);
        return -1;
    }
    if (QLIBCFileAddSection(file.c_str(), section.name, hash, kSectionFormat) != 0) {
        VORN_LOG(LOG_ERR, "Failed to add %s section [file: %s]", section.word, file.c_str());
        return -1;
    }
    QLIBCHashRemoveAll(hash);
    return 0;
}

int ReadSection(const std::string& file, QLIBSZHASH* hash, const Section& section) {
    QLIBCHashRemoveAll(hash);
    if (QLIBCFileGetSection(file.c_str(), section.name, &hash) < 0) {
        VORN_LOG(LOG_ERR, "Failed to load %s section [file: %s]", section.word, file.c_str());
        return -1;
    }
    return 0;
}

}  // namespace

Router6Attr::Router6Attr(const std::string& kind, const std::string& wanName,
                         const std::string& routed, const std::string& localAddrV4,
                         const std::string& remoteAddrV4, const std::string& localAddrV6,
                         bool isDefaultGateway)
    : type(kind),
      wan(wanName),
      prefix(routed),
      local_addr_v4(localAddrV4),
      remote_addr_v4(remoteAddrV4),
      local_addr_v6(localAddrV6),
      is_default_gateway(isDefaultGateway) {}

Router6Attr::Router6Attr(const std::string& wanName, bool isDefaultGateway)
    : wan(wanName), is_default_gateway(isDefaultGateway) {}

bool Router6Attr::operator==(const Router6Attr& other) const {
    return type == other.type && wan == other.wan && prefix == other.prefix &&
           local_addr_v4 == other.local_addr_v4 && remote_addr_v4 == other.remote_addr_v4 &&
           local_addr_v6 == other.local_addr_v6 && lan == other.lan &&
           is_default_gateway == other.is_default_gateway;
}

std::string Router6Attr::ConvertInterface(const std::string& name) {
    if (name != "pppoe") {
        return name;
    }
    char buffer[kNameSize] = {};
    if (VORNPPPoeIntfGet(buffer, sizeof(buffer)) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get PPPoE interface");
        return "";
    }
    return buffer;
}

std::string Router6Attr::TunnelName(const std::string& wan) {
    return kTunnelPrefix + ConvertInterface(wan);
}

std::string Router6Attr::GetConfigName() const {
    return kConfigPrefix + ConvertInterface(wan);
}

int Router6Attr::SaveConfig() const {
    const std::string file = GetConfigName();
    HashPtr hash = SettingsHash(wan, ConvertInterface(wan));
    if (hash == nullptr || vornwireless::utils::CheckAndMakeDir(kConfigDir, 0755) != 0) {
        return -1;
    }
    QLIBCSysUnlink(file.c_str());
    if (AddSection(file, hash.get(), GenConfSection(hash.get()), kConf) != 0 ||
        AddSection(file, hash.get(), GenAddrSection(hash.get()), kAddr) != 0 ||
        AddSection(file, hash.get(), GenPrefSection(hash.get()), kPref) != 0) {
        return -1;
    }
    return 0;
}

int Router6Attr::LoadConfig() {
    const std::string converted = ConvertInterface(wan);
    const std::string tunnel = kTunnelPrefix + converted;
    const std::string file = kConfigPrefix + converted;
    HashPtr hash = SettingsHash(wan, converted);
    if (hash == nullptr) {
        return -1;
    }
    if (QLIBCFileExist(file.c_str()) != 1) {
        VORN_LOG(LOG_WARNING, "No existing IPv6 config");
        return -1;
    }
    if (ReadSection(file, hash.get(), kConf) != 0) {
        return -1;
    }
    GetConfSection(hash.get());
    if (ReadSection(file, hash.get(), kAddr) != 0) {
        return -1;
    }
    GetAddrSection(hash.get());
    if (ReadSection(file, hash.get(), kPref) != 0) {
        return -1;
    }
    GetPrefSection(hash.get());
    const std::string routeDevice = type == "native" ? converted : tunnel;
    is_default_gateway = vornwireless::utils::GetGatewayPriority(routeDevice, "GTYPE_V6") == 0;
    return 0;
}

int Router6Attr::RemoveConfig() const {
    return QLIBCSysUnlink(GetConfigName().c_str());
}

void Router6Attr::AddLan(const std::string& name, const std::string& value) {
    for (auto& entry : lan) {
        if (entry.first == name) {
            entry.second = value;
            return;
        }
    }
    lan.emplace_back(name, value);
}

void Router6Attr::RemoveLan(const std::string& name, const std::string& value) {
    for (auto entry = lan.begin(); entry != lan.end(); ++entry) {
        if (entry->first == name && (value.empty() || entry->second == value)) {
            lan.erase(entry);
            return;
        }
    }
}

std::string Router6Attr::LanValue(const std::string& name) const {
    for (const auto& entry : lan) {
        if (entry.first == name) {
            return entry.second;
        }
    }
    return "";
}

Json::Value Router6Attr::ToJson() const {
    Json::Value config(Json::objectValue);
    PutIfSet(config, "wan", wan);
    PutIfSet(config, "prefix", prefix);
    PutIfSet(config, "remote_addr_v4", local_addr_v4);
    PutIfSet(config, "remote_addr_v4", remote_addr_v4);
    PutIfSet(config, "local_addr_v6", local_addr_v6);
    Json::Value json(Json::objectValue);
    if (!config.empty()) {
        json["config"] = config;
    }
    PutIfSet(json, "type", type);
    json["is_default_gateway"] = is_default_gateway;
    return json;
}

int Router6Attr::GenConfSection(QLIBSZHASH* hash) const {
    return Put(hash, "type", type) + Put(hash, "wan", wan) + Put(hash, "prefix", prefix);
}

int Router6Attr::GenAddrSection(QLIBSZHASH* hash) const {
    return Put(hash, "local_addr_v4", local_addr_v4) + Put(hash, "remote_addr_v4", remote_addr_v4) +
           Put(hash, "local_addr_v6", local_addr_v6);
}

int Router6Attr::GenPrefSection(QLIBSZHASH* hash) const {
    int failed = 0;
    for (const auto& entry : lan) {
        failed += Put(hash, entry.first.c_str(), entry.second);
    }
    return failed;
}

void Router6Attr::GetConfSection(const QLIBSZHASH* hash) {
    type = Value(hash, "type");
    wan = Value(hash, "wan");
    prefix = Value(hash, "prefix");
}

void Router6Attr::GetAddrSection(const QLIBSZHASH* hash) {
    local_addr_v4 = Value(hash, "local_addr_v4");
    remote_addr_v4 = Value(hash, "remote_addr_v4");
    local_addr_v6 = Value(hash, "local_addr_v6");
}

void Router6Attr::GetPrefSection(const QLIBSZHASH* hash) {
    lan.clear();
    for (int i = 0; i < QLIBCSzHashCount(hash); ++i) {
        lan.emplace_back(QLIBCSzHashKeyAt(hash, i), QLIBCSzHashValueAt(hash, i));
    }
}

// inet_pton reads up to a NUL: a text holding one would pass and then be cut on its way out.
bool IsIPv6Prefix(const std::string& text) {
    const size_t slash = text.find('/');
    if (text.find('\0') != std::string::npos) {
        return false;
    }
    if (slash == std::string::npos || slash + 1 == text.size() || text.size() - slash > 4) {
        return false;
    }
    const std::string length = text.substr(slash + 1);
    if (length.find_first_not_of("0123456789") != std::string::npos ||
        std::atoi(length.c_str()) > 128) {
        return false;
    }
    in6_addr address;
    return inet_pton(AF_INET6, text.substr(0, slash).c_str(), &address) == 1;
}

bool IsIPv4Address(const std::string& text) {
    in_addr address;
    return text.find('\0') == std::string::npos && inet_pton(AF_INET, text.c_str(), &address) == 1;
}

bool IsTunnelType(const std::string& type) {
    return type == "6in4" || type == "6to4";
}

bool IsValidWan(const std::string& wan, const std::string& type) {
    if (wan != "pppoe" && !IsValidInterfaceName(wan)) {
        return false;
    }
    const std::string converted = Router6Attr::ConvertInterface(wan);
    return IsValidInterfaceName(converted) &&
           (!IsTunnelType(type) || IsValidInterfaceName(Router6Attr::TunnelName(wan)));
}

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn
