#include "ipv6/router/6in4.h"

#include "utils/dbus_client.h"
#include "utils/log.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {
namespace {

const char kIp[] = "/sbin/ip";

}  // namespace

bool Tunnel6in4::ValidateAttr() const {
    if (!IsIPv4Address(attr_.local_addr_v4)) {
        VORN_LOG(LOG_ERR, "Invalid local v4 address (%s)", attr_.local_addr_v4.c_str());
        return false;
    }
    if (!IsIPv4Address(attr_.remote_addr_v4)) {
        VORN_LOG(LOG_ERR, "Invalid remote v4 address (%s)", attr_.remote_addr_v4.c_str());
        return false;
    }
    if (!IsIPv6Prefix(attr_.local_addr_v6)) {
        VORN_LOG(LOG_ERR, "Invalid local v6 address (%s)", attr_.local_addr_v6.c_str());
        return false;
    }
    if (!IsIPv6Prefix(attr_.prefix)) {
        VORN_LOG(LOG_ERR, "Invalid IPv6 prefix: [%s]", attr_.prefix.c_str());
        return false;
    }
    if (!Router6Base::ValidateAttr()) {
        VORN_LOG(LOG_ERR, "Base check failed");
        return false;
    }
    return true;
}

bool Tunnel6in4::Create() const {
    const std::string device = Router6Attr::TunnelName(attr_.wan);
    if (!Run(kIp, {"tunnel", "add", device, "mode", "sit", "remote", attr_.remote_addr_v4, "local",
                   attr_.local_addr_v4, "ttl", "255"})) {
        VORN_LOG(LOG_ERR, "Failed to create tunnel device %s (%s -> %s)", device.c_str(),
                 attr_.local_addr_v4.c_str(), attr_.remote_addr_v4.c_str());
        return false;
    }
    if (!Run(kIp, {"link", "set", device, "up"})) {
        VORN_LOG(LOG_ERR, "Failed to bring up device %s", device.c_str());
        return false;
    }
    if (!Run(kIp, {"addr", "add", attr_.local_addr_v6, "dev", device})) {
        VORN_LOG(LOG_ERR, "Failed to add [%s] to device %s", attr_.local_addr_v6.c_str(),
                 device.c_str());
        return false;
    }
    return AnnounceGateway(device, "::") && Router6Base::Create();
}

// Goes on after a failed step: a tunnel already gone must not keep its gateway and settings.
bool Tunnel6in4::Destroy() const {
    const std::string device = Router6Attr::TunnelName(attr_.wan);
    bool done = true;
    if (!Run(kIp, {"tunnel", "del", device})) {
        VORN_LOG(LOG_ERR, "Unable to delete tunnel device %s", device.c_str());
        done = false;
    }
    if (!vornwireless::utils::DelGatewayInfo(device, "GTYPE_V6", true)) {
        VORN_LOG(LOG_ERR, "Failed to del gateway info on dev %s", device.c_str());
        done = false;
    }
    return Router6Base::Destroy() && done;
}

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn
