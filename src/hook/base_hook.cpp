#include "hook/base_hook.h"

#include "platform/qlibc_error.h"
#include "utils/log.h"

namespace vornwireless {
namespace hook {
namespace {

const char kModule[] = "net";

// Routes without a destination or gateway are announced with the any-address.
std::string AddressOrAny(const std::string& address) {
    return address.empty() ? "0.0.0.0" : address;
}

bool IsValidIPChange(IPTYPE type, const std::string& ifname, const std::string& address,
                     int prefixLength) {
    if (ifname.empty() || address.empty() || (type != IPTYPE_IPV4 && type != IPTYPE_IPV6)) {
        return false;
    }
    const unsigned int maxPrefix = type == IPTYPE_IPV4 ? 32 : 128;
    return static_cast<unsigned int>(prefixLength) <= maxPrefix;
}

}  // namespace

BaseHook::BaseHook(const std::string& module, const std::string& path)
    : module_(module), path_(path) {
    Init();
}

BaseHook::~BaseHook() {
    QLIBPluginExit(handle_);
}

int BaseHook::Init() {
    if (QLIBPluginSDKInit(module_.c_str(), path_.c_str(), &handle_) != 0) {
        handle_ = nullptr;
        VORN_LOG(LOG_ERR, "Failed to init hook in module [%s] and path [%s]", module_.c_str(),
                 path_.c_str());
        return -1;
    }
    return 0;
}

int BaseHook::SetEnv(const std::string& key, const std::string& value) {
    if (handle_ == nullptr) {
        VORN_LOG(LOG_ERR, "Not init or init failed");
        return -1;
    }
    if (QLIBPluginSetArg(handle_, key.c_str(), value.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set plugin argument key=%s value=%s", key.c_str(),
                 value.c_str());
        return -1;
    }
    env_[key] = value;
    return 0;
}

std::string BaseHook::GetEnv(const std::string& key) const {
    const auto found = env_.find(key);
    return found != env_.end() ? found->second : "";
}

bool BaseHook::ExecHook(int action) {
    if (handle_ == nullptr) {
        VORN_LOG(LOG_ERR, "Not init or init failed");
        return false;
    }
    if (!IsValid()) {
        VORN_LOG(LOG_ERR, "Hook environment is not valid");
        return false;
    }
    if (QLIBPluginAction(action, handle_) != 0) {
        VORN_LOG(LOG_ERR, "Failed to exec hook at action [%d]", action);
        return false;
    }
    return true;
}

ArpIgnoreChangeHook::ArpIgnoreChangeHook(bool value) : BaseHook(kModule, "net/arp_ignore_change") {
    SetEnv("NEW_VALUE", value ? "true" : "false");
}

BondChangeHook::BondChangeHook(const std::string& action) : BaseHook(kModule, "net/bond_change") {
    SetEnv("ACTION", action);
}

GatewayChangeHook::GatewayChangeHook(const std::string& action, const std::string& ifname,
                                     const std::string& destination, const std::string& gateway)
    : BaseHook(kModule, "net/gateway_change") {
    SetEnv("ACTION", action);
    SetEnv("IFNAME", ifname);
    SetEnv("DESTINATION", AddressOrAny(destination));
    SetEnv("GATEWAY", AddressOrAny(gateway));
}

bool GatewayChangeHook::IsValid() const {
    return !GetEnv("ACTION").empty() && !GetEnv("IFNAME").empty();
}

TopologyChangeHook::TopologyChangeHook(const std::string& oldTopology,
                                       const std::string& newTopology)
    : BaseHook(kModule, "net/topology_change") {
    SetEnv("OLD_TOPOLOGY", oldTopology);
    SetEnv("NEW_TOPOLOGY", newTopology);
}

bool TopologyChangeHook::IsValid() const {
    return !GetEnv("OLD_TOPOLOGY").empty() && !GetEnv("NEW_TOPOLOGY").empty();
}

bool NetIPChangeEvent(IPTYPE type, const std::string& ifname, const std::string& origin,
                      const std::string& address, int prefixLength) {
    if (!IsValidIPChange(type, ifname, address, prefixLength)) {
        VORN_LOG(LOG_ERR, "Invalid IP change of [%s] to [%s/%d]", ifname.c_str(), address.c_str(),
                 prefixLength);
        QLIBCErrSet(QLIBC_ERR_INVALID_ARG);
        return false;
    }
    BaseHook hook(kModule, type == IPTYPE_IPV4 ? "net/ipv4_change" : "net/ipv6_change");
    if (hook.SetEnv("IFNAME", ifname) != 0 || hook.SetEnv("ORIGIN_ADDRESS", origin) != 0 ||
        hook.SetEnv("NEW_ADDRESS", address) != 0 ||
        hook.SetEnv("PREFIX_LENGTH", std::to_string(prefixLength)) != 0) {
        QLIBCErrSet(QLIBC_ERR_INVALID_ARG);
        return false;
    }
    if (!hook.ExecHook(QLIB_PLUGIN_ACTION_AFTER)) {
        QLIBCErrSet(QLIBC_ERR_EXEC);
        return false;
    }
    return true;
}

}  // namespace hook
}  // namespace vornwireless
