#include "ipv6/router/dhcp_pd.h"

#include <fstream>

#include "platform/root_path.h"
#include "platform/vorn_ipv6.h"
#include "utils/file.h"
#include "utils/log.h"

namespace vorn {
namespace network {
namespace ipv6 {
namespace router {
namespace {

const char kDhclient[] = "/usr/sbin/dhclient";
const char kLeaseDirs[][32] = {"/etc/dhclient", "/etc/dhclient/ipv6"};
const char kLeasePrefix[] = "/etc/dhclient/ipv6/dhcpv6.lease.";
constexpr int kDuidSize = 256;

}  // namespace

DHCPPD::DHCPPD(const Router6Attr& attr)
    : Router6Base(attr),
      lease_file_(kLeasePrefix + Router6Attr::ConvertInterface(attr.wan)),
      pid_file_("/tmp/dhclient6-" + Router6Attr::ConvertInterface(attr.wan) + ".pid") {}

bool DHCPPD::operator==(const Router6Base& other) const {
    const DHCPPD* client = dynamic_cast<const DHCPPD*>(&other);
    return client != nullptr && Router6Base::operator==(other) &&
           lease_file_ == client->lease_file_ && pid_file_ == client->pid_file_;
}

bool DHCPPD::ValidateAttr() const {
    const std::string wan = Router6Attr::ConvertInterface(attr_.wan);
    if (!IsValidWan(attr_.wan, attr_.type)) {
        VORN_LOG(LOG_ERR, "Invalid wan interface [%s]", attr_.wan.c_str());
        return false;
    }
    if (VORNNetIfIsUp(wan.c_str()) != 1) {
        VORN_LOG(LOG_ERR, "wan interface %s is down", wan.c_str());
        return false;
    }
    if (!Router6Base::ValidateAttr()) {
        VORN_LOG(LOG_ERR, "Base check failed");
        return false;
    }
    return true;
}

bool DHCPPD::GenerateLeaseFile() const {
    const std::string wan = Router6Attr::ConvertInterface(attr_.wan);
    char duid[kDuidSize] = {};
    if (GenDUID(wan.c_str(), VORN_DUID_LL, duid, sizeof(duid)) != 0) {
        VORN_LOG(LOG_ERR, "Failed to generate DUID");
        return false;
    }
    for (const char* dir : kLeaseDirs) {
        vornwireless::utils::CheckAndMakeDir(dir, 0755);
    }
    std::ofstream lease(vorn::platform::RootPath(lease_file_), std::ios::trunc);
    lease << "default-duid \"" << duid << "\";\n";
    lease.close();
    if (lease.fail()) {
        VORN_LOG(LOG_ERR, "Failed to open lease file [%s] for writing DUID", lease_file_.c_str());
        return false;
    }
    return true;
}

// mode: "" to start the client, "-x" to stop it.
bool DHCPPD::RunClient(const char* mode) const {
    std::vector<std::string> words = {"-6",
                                      "-lf",
                                      vorn::platform::RootPath(lease_file_),
                                      "-pf",
                                      vorn::platform::RootPath(pid_file_),
                                      "-P",
                                      "-nw",
                                      Router6Attr::ConvertInterface(attr_.wan)};
    if (*mode != '\0') {
        words.insert(words.begin() + 1, mode);
    }
    return Run(kDhclient, words);
}

bool DHCPPD::Create() const {
    const std::string wan = Router6Attr::ConvertInterface(attr_.wan);
    if (!GenerateLeaseFile()) {
        VORN_LOG(LOG_ERR, "Failed to gen lease file");
        return false;
    }
    if (!RunClient("")) {
        VORN_LOG(LOG_ERR, "Failed to execute dhclient on dev [%s]", wan.c_str());
        return false;
    }
    return AnnounceGateway(wan, "NULL") && Router6Base::Create();
}

bool DHCPPD::Destroy() const {
    if (!RunClient("-x")) {
        VORN_LOG(LOG_ERR, "Unable to release lease on dev [%s]", attr_.wan.c_str());
        return false;
    }
    return Router6Base::Destroy();
}

}  // namespace router
}  // namespace ipv6
}  // namespace network
}  // namespace vorn
