#ifndef VORN_NETWORK_DHCP_DHCPD_CONFIG_H
#define VORN_NETWORK_DHCP_DHCPD_CONFIG_H

#include <cstdint>
#include <string>
#include <vector>

#include "platform/qlibc_container.h"

namespace vornnetwork {
namespace network {
namespace dhcp {

// The services of the DHCP server on one interface; a bit set where a call takes several.
enum SERVICE_TYPE {
    SERVICE_TYPE_IPV4 = 1,  // IPv4 subnets, numbered from 0
    SERVICE_TYPE_IPV6 = 2,  // IPv6 subnets, numbered from 0
    SERVICE_TYPE_PXE = 4,   // one PXE boot service
    SERVICE_TYPE_WPAD = 8,  // one proxy auto-discovery URL
    SERVICE_TYPE_ALL = 15
};

// One service's settings.
struct DHCPD_CONF {
    // The service's number among those of its type: it names the file (subnets only). Loads set
    // it; saveConf numbers the records of a type in the order it is given them.
    uint32_t index;
    SERVICE_TYPE type;
    int lease;  // seconds
    char start[20];
    char end[20];
    char ifname[16];
    char domain[4096];
    char dns1[20];
    char dns2[20];
    char netmask[20];  // the prefix length for IPv6
    char router[20];   // the URL for WPAD
    char boot[128];    // the size of the BOOTP file field
};

// The DHCP server's per-interface files under "/etc/dhcpd/": for each service a ".conf" file in
// dnsmasq's syntax and an ".info" file of key=value settings ("enable", "pxe", "url"). A service
// counts only while both of its files exist.
//
// Calls return -1 (or false) on failure with a platform error code set: QLIBC_ERR_INVALID_ARG for
// a bad type, index or field, QLIBC_ERR_FILE_IO for files that cannot be made or written, and
// QLIBC_ERR_FORMAT for a ".conf" file that does not read back. Every file is replaced only by
// renaming a complete temporary file over it, so a failed save leaves the previous one in place.
class DhcpdConfig {
  public:
    static const SERVICE_TYPE kServiceTypes[4];

    // The path of a service's ".conf" (conf) or ".info" file. The interface name is cut at the
    // first character that could leave the directory or split the name ("eth0.5" -> "eth0").
    static int getFileName(std::string& out, const std::string& ifname, SERVICE_TYPE type,
                           bool conf, int index = 0);

    // Subnets: how many indices from 0 up have both files. PXE and WPAD: 1 or 0.
    static int getSubnetCntType(const std::string& ifname, SERVICE_TYPE type);
    static int getSubnetCnt(const std::string& ifname, int types);

    // Whether an ".info" file's "enable" key is "yes"; for a type, whether any of its counted
    // services is enabled, and for a bit set, any of its types.
    static bool isEnabledFile(const std::string& path);
    static bool isEnabledType(const std::string& ifname, SERVICE_TYPE type);
    static bool isEnabled(const std::string& ifname, int types);

    // Reads a ".conf" file over conf: the fields the file holds are replaced, the others kept.
    static int loadConfFile(DHCPD_CONF& conf, const std::string& path);
    // Append one record per counted service, in index order and then type order; return how many.
    // A WPAD record, whose file names no interface, gets ifname.
    static int loadConfType(std::vector<DHCPD_CONF>& confs, const std::string& ifname,
                            SERVICE_TYPE type);
    static int loadConf(std::vector<DHCPD_CONF>& confs, const std::string& ifname, int types);

    // Writes conf into a new temporary file beside its ".conf" file and gives its logical path.
    // tag marks the lines that belong to this service.
    static int saveConfFile(std::string& tmpPath, const DHCPD_CONF& conf, const std::string& tag);
    // Writes the ".conf" files of the records of type (at most one for PXE and WPAD) whose
    // interface has ifname's files, and removes the ".conf" files of the services beyond them.
    // Nothing is renamed until every temporary file is complete. Returns how many were written.
    static int saveConfType(const std::vector<DHCPD_CONF>& confs, const std::string& ifname,
                            SERVICE_TYPE type);
    static int saveConf(const std::vector<DHCPD_CONF>& confs, const std::string& ifname, int types);

    // The ".info" file of a service: its "enable", "pxe" and "url" keys, values in double quotes.
    static int loadInfo(QLIBSZHASH* hash, const std::string& ifname, SERVICE_TYPE type,
                        int index = 0);
    static int saveInfo(QLIBSZHASH* hash, const std::string& ifname, SERVICE_TYPE type,
                        int index = 0);
    // Writes the hash's ".info" keys into a new temporary file beside path.
    static int saveInfoFile(std::string& tmpPath, QLIBSZHASH* hash, const std::string& path);
};

}  // namespace dhcp
}  // namespace network
}  // namespace vornnetwork

#endif
