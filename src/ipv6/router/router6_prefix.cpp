#include "ipv6/router/router6_prefix.h"

#include <arpa/inet.h>
#include <dirent.h>

#include <algorithm>
#include <cstdlib>
#include <fstream>
#include <sstream>

#include "ipv6/router/dhcp_pd.h"
#include "platform/qlibc_file.h"
#include "platform/root_path.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {
namespace {

const char kConfigDir[] = "/etc/sysconfig/networking";
const char kConfigPrefix[] = "ipv6-";
constexpr int kMaxPrefixLength = 63;
constexpr size_t kMaxLeaseLines = 4096;

// The "wan" key of a settings file's "conf" section, "" when it cannot be read.
std::string StoredWan(const std::string& file) {
    QLIBSZHASH* hash = QLIBCSzHashAlloc(16);
    std::string wan;
    if (hash != nullptr && QLIBCFileGetSection(file.c_str(), "conf", &hash) > 0) {
        const char* value = QLIBCSzHashGetValue(hash, "wan");
        wan = value != nullptr ? value : "";
    }
    QLIBCSzHashFree(hash);
    return wan;
}

// The last prefix an "iaprefix 2001:db8:1::/56 {" line of the lease file names.
std::string DelegatedPrefix(const Router6Attr& attr) {
    std::ifstream lease(vorn::platform::RootPath(DHCPPD(attr).LeaseFile()));
    std::string line;
    std::string prefix;
    for (size_t count = 0; count < kMaxLeaseLines && std::getline(lease, line); ++count) {
        std::istringstream words(line);
        std::string word;
        if (words >> word && word == "iaprefix" && words >> word && IsIPv6Prefix(word)) {
            prefix = word;
        }
    }
    return prefix;
}

// The prefix to split for attr: its own, else a native router's delegated one.
std::string RoutedPrefix(const Router6Attr& attr) {
    return attr.prefix.empty() && attr.type == "native" ? DelegatedPrefix(attr) : attr.prefix;
}

}  // namespace

Router6Prefix::Router6Prefix() {
    if (!Load()) {
        VORN_LOG(LOG_ERR, "Failed to load (some of) IPv6 router config");
    }
}

bool Router6Prefix::Load() {
    routers_.clear();
    DIR* dir = opendir(vorn::platform::RootPath(kConfigDir).c_str());
    if (dir == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to enum dir (%s/%s)", kConfigDir, kConfigPrefix);
        return false;
    }
    std::vector<std::string> files;
    while (const dirent* entry = readdir(dir)) {
        const std::string name = entry->d_name;
        if (name.compare(0, sizeof(kConfigPrefix) - 1, kConfigPrefix) == 0) {
            files.push_back(std::string(kConfigDir) + "/" + name);
        }
    }
    closedir(dir);
    std::sort(files.begin(), files.end());
    bool loaded = true;
    for (const std::string& file : files) {
        Router6Attr attr(StoredWan(file), false);
        if (!vornwireless::utils::IsValidInterfaceName(attr.wan) || attr.LoadConfig() != 0) {
            VORN_LOG(LOG_ERR, "Failed to get wan from %s", file.c_str());
            loaded = false;
            continue;
        }
        routers_.push_back(attr);
    }
    return loaded;
}

Router6Attr* Router6Prefix::Find(const std::string& wan) {
    for (Router6Attr& attr : routers_) {
        if (attr.wan == wan) {
            return &attr;
        }
    }
    return nullptr;
}

bool Router6Prefix::Allocate(const std::string& lan, const std::string& wan) {
    Router6Attr* attr = Find(wan);
    if (attr == nullptr || !vornwireless::utils::IsValidInterfaceName(lan)) {
        VORN_LOG(LOG_ERR, "Unable to enumerate available prefix");
        return false;
    }
    if (!attr->LanValue(lan).empty()) {
        return true;
    }
    const std::string prefix = RoutedPrefix(*attr);
    if (!IsIPv6Prefix(prefix)) {
        VORN_LOG(LOG_ERR, "Unable to tokenize prefix %s, skip", prefix.c_str());
        return false;
    }
    const size_t slash = prefix.find('/');
    const std::vector<std::string> candidates =
        EnumPrefix64(prefix.substr(0, slash), std::atoi(prefix.c_str() + slash + 1));
    if (candidates.empty()) {
        VORN_LOG(LOG_ERR, "Unable to enumerate available prefix");
        return false;
    }
    for (const std::string& candidate : candidates) {
        const std::string value = NormalizePrefix(candidate + "/64");
        const bool taken = std::any_of(attr->lan.begin(), attr->lan.end(),
                                       [&](const auto& entry) { return entry.second == value; });
        if (!value.empty() && !taken) {
            attr->AddLan(lan, value);
            return attr->SaveConfig() == 0;
        }
    }
    VORN_LOG(LOG_ERR, "Unable to find matching prefix %s allocate for %s", prefix.c_str(),
             lan.c_str());
    return false;
}

bool Router6Prefix::Deallocate(const std::string& lan, const std::string& wan) {
    Router6Attr* attr = Find(wan);
    if (attr == nullptr || attr->LanValue(lan).empty()) {
        VORN_LOG(LOG_ERR, "No matching prefix %s on %s to remove, possibly gone", lan.c_str(),
                 wan.c_str());
        return false;
    }
    attr->RemoveLan(lan, "");
    return attr->SaveConfig() == 0;
}

std::string Router6Prefix::AllocatedTo(const std::string& lan, const Router6Attr& attr) const {
    return attr.LanValue(lan);
}

std::string Router6Prefix::NormalizePrefix(const std::string& prefix) {
    const size_t slash = prefix.find('/');
    const std::string address = prefix.substr(0, slash);
    in6_addr binary;
    if (inet_pton(AF_INET6, address.c_str(), &binary) != 1) {
        VORN_LOG(LOG_ERR, "Failed to convert %s into binary form", prefix.c_str());
        return "";
    }
    char text[INET6_ADDRSTRLEN];
    if (inet_ntop(AF_INET6, &binary, text, sizeof(text)) == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to convert prefix into text form");
        return "";
    }
    return text + (slash == std::string::npos ? "" : prefix.substr(slash));
}

std::vector<std::string> Router6Prefix::EnumPrefix64(const std::string& prefix, int length) {
    if (length > 64) {
        VORN_LOG(LOG_ERR, "Error: require larger prefix range for splitting (cur: %d, max: %d)",
                 length, kMaxPrefixLength);
        return {};
    }
    if (length == 64) {
        return {prefix};
    }
    in6_addr binary;
    if (inet_pton(AF_INET6, prefix.c_str(), &binary) != 1) {
        VORN_LOG(LOG_ERR, "Failed to convert %s into binary form", prefix.c_str());
        return {};
    }
    std::vector<std::string> prefixes;
    for (unsigned char bit : {0, 1}) {
        binary.s6_addr[7] = static_cast<unsigned char>((binary.s6_addr[7] & 0xfe) | bit);
        char text[INET6_ADDRSTRLEN];
        if (inet_ntop(AF_INET6, &binary, text, sizeof(text)) == nullptr) {
            VORN_LOG(LOG_ERR, "Failed to split prefix back (%s)", prefix.c_str());
            return {};
        }
        prefixes.push_back(text);
    }
    return prefixes;
}

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn
