#include "utils/file.h"

#include <sys/stat.h>

#include "platform/qlibc_file.h"
#include "platform/root_path.h"
#include "utils/interface_name.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {

int CheckAndMakeDir(const std::string& dir, unsigned int mode) {
    if (QLIBCFileCheckDir(dir.c_str(), mode) > 0 ||
        mkdir(vorn::platform::RootPath(dir).c_str(), 0755) == 0) {
        return 0;
    }
    VORN_LOG(LOG_ERR, "Failed to mkdir [%s][%d]", dir.c_str(), static_cast<int>(mode));
    return -1;
}

int CopyIfcfgIPv6Attrs(const std::string& from, const std::string& to) {
    static const char* const kKeys[] = {"IPV6INIT", "IPV6ADDR", "IPV6PREFIXLENG", "IPV6_DEFAULTGW",
                                        "IPV6DNS"};
    static const std::string kDir = "/etc/sysconfig/network-scripts/ifcfg-";
    if (!IsValidInterfaceName(from) || !IsValidInterfaceName(to)) {
        VORN_LOG(LOG_ERR, "Bad interface name [%s] or [%s]", from.c_str(), to.c_str());
        return -1;
    }
    const std::string source = kDir + from;
    const std::string target = kDir + to;
    for (const char* key : kKeys) {
        char value[1024] = {};
        if (QLIBCFileGetKeyValue(source.c_str(), key, value, sizeof(value), 0) <= 0) {
            continue;
        }
        if (QLIBCFileSetKeyValue(target.c_str(), key, value) < 0) {
            VORN_LOG(LOG_ERR, "Failed to copy [%s=%s] from %s to %s", key, value, source.c_str(),
                     target.c_str());
            return -1;
        }
    }
    return 0;
}

}  // namespace utils
}  // namespace vornwireless
