#include "ipv6/router/router6_base.h"

#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/vorn_ipv6.h"
#include "utils/dbus_client.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/reset_files.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {
namespace {

const char kIfcfgPrefix[] = "/etc/sysconfig/network-scripts/ifcfg-";
const char kForwarding[] = "/proc/sys/net/ipv6/conf/all/forwarding";
// The longest command line here: the tunnel's.
constexpr size_t kMaxWords = 11;

bool IsKnownType(const std::string& type) {
    return type == "native" || IsTunnelType(type);
}

bool IsValidLan(const std::pair<std::string, std::string>& entry) {
    if (!vornwireless::utils::IsValidInterfaceName(entry.first)) {
        VORN_LOG(LOG_ERR, "Invalid lan interface [%s]", entry.first.c_str());
        return false;
    }
    if (!entry.second.empty() && !IsIPv6Prefix(entry.second)) {
        VORN_LOG(LOG_ERR, "Invalid IPv6 prefix: [%s]", entry.second.c_str());
        return false;
    }
    return true;
}

}  // namespace

bool Router6Base::Create() const {
    return attr_.SaveConfig() == 0 && SetSysConfig(true);
}

bool Router6Base::Destroy() const {
    return attr_.RemoveConfig() == 0 && SetSysConfig(false);
}

bool Router6Base::ValidateAttr() const {
    if (!IsKnownType(attr_.type)) {
        VORN_LOG(LOG_ERR, "Bad type: %s", attr_.type.c_str());
        return false;
    }
    if (!IsValidWan(attr_.wan, attr_.type)) {
        VORN_LOG(LOG_ERR, "Invalid wan interface [%s]", attr_.wan.c_str());
        return false;
    }
    for (const auto& entry : attr_.lan) {
        if (!IsValidLan(entry)) {
            return false;
        }
    }
    const std::string device = Router6Attr::ConvertInterface(attr_.wan);
    if (VORNNetIPv6Enable(device.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to enable IPv6 on dev [%s]", device.c_str());
        return false;
    }
    if (!vornwireless::utils::SetProcEntry(kForwarding, "1")) {
        VORN_LOG(LOG_ERR, "Failed to enable IPv6 forwarding in [%s]", kForwarding);
        return false;
    }
    return true;
}

bool Router6Base::SetSysConfig(bool on) const {
    if (attr_.wan.empty()) {
        VORN_LOG(LOG_INFO, "Empty wan, skip");
        return true;
    }
    const std::string file = kIfcfgPrefix + Router6Attr::ConvertInterface(attr_.wan);
    const char* value = on ? "yes" : "no";
    if (QLIBCFileSetKeyValue(file.c_str(), "IPV6ROUTER", value) != 0) {
        VORN_LOG(LOG_ERR, "Failed to set %s=%s in %s", "IPV6ROUTER", value, file.c_str());
        return false;
    }
    return true;
}

bool Router6Base::AddLan(const std::string& lan, const std::string& prefix) {
    if (!IsValidLan({lan, prefix})) {
        return false;
    }
    attr_.AddLan(lan, prefix);
    return true;
}

bool Router6Base::RemoveLan(const std::string& lan, const std::string& prefix) {
    if (!IsValidLan({lan, prefix})) {
        return false;
    }
    attr_.RemoveLan(lan, prefix);
    return true;
}

bool Router6Base::AnnounceGateway(const std::string& device, const std::string& gateway) const {
    if (!vornwireless::utils::SetGatewayInfo(device, "GTYPE_V6", gateway, "NULL", "ethernet",
                                             attr_.is_default_gateway ? 0 : -1, true)) {
        VORN_LOG(LOG_ERR, "Failed to add gateway info on dev %s", device.c_str());
        return false;
    }
    return true;
}

bool Router6Base::Run(const char* program, const std::vector<std::string>& words) {
    if (words.size() > kMaxWords) {
        return false;
    }
    const char* argv[kMaxWords + 1] = {};
    for (size_t i = 0; i < words.size(); ++i) {
        argv[i] = words[i].c_str();
    }
    // Unused places are null and end the argument list early.
    return QLIBCExecl(program, QLIBC_EXEC_WAIT | QLIBC_EXEC_NO_STDIN | QLIBC_EXEC_NO_STDOUT,
                      argv[0], argv[1], argv[2], argv[3], argv[4], argv[5], argv[6], argv[7],
                      argv[8], argv[9], argv[10], static_cast<char*>(nullptr)) == 0;
}

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn
