#ifndef VORN_PLATFORM_VORN_BRIDGE_H
#define VORN_PLATFORM_VORN_BRIDGE_H

#include "platform/qlibc_container.h"

#ifdef __cplusplus
extern "C" {
#endif

/* How a bridge's ifcfg files change. */
typedef enum _tag_BR_TYPE {
    BR_TYPE_REMOVE = 1,      /* the plain bridge is dissolved: bridge name only */
    BR_TYPE_TAKE_OVER = 2,   /* the plain bridge takes over its slave's address */
    BR_TYPE_OWN_ADDRESS = 3, /* local and guest bridges: an address of their own */
    BR_TYPE_SLAVE_ONLY = 4   /* the slave joins, the bridge's address stays */
} BR_TYPE;

typedef struct _tag_BRIDGE_INFO {
    char bridge[16];
    char slave[16];
    char bootproto[16]; /* "static" */
    char ipv4[20];
    char netmask[20];
    BR_TYPE type;
} BRIDGE_INFO;

/* Writes the bridge's "/etc/sysconfig/network-scripts/ifcfg-BR" (DEVICE, TYPE=Bridge, BOOTPROTO,
 * IPADDR, NETMASK, ONBOOT=yes) and the slave's (BRIDGE=BR; type 2 also drops the slave's own
 * address from the running interface) and applies them: "/usr/vorn/sbin/brctl" "addbr" when the
 * bridge does not exist, "/sbin/ip" "addr" "replace" ADDR/LEN "dev" BR, "/sbin/ip" "link" "set"
 * BR "up". Type 1 takes the bridge down and deletes it ("brctl" "delbr"), sets ONBOOT=no in its
 * file and removes BRIDGE=BR from the ifcfg files that carry it. Names, addresses and the netmask
 * are checked first (-1, QLIBC_ERR_INVALID_ARG, nothing written). 0 or -1. */
int VORNNetSetBridgeConfig(const BRIDGE_INFO* info);

/* IPv6 on an interface: action 0 enables it, 1 disables it
 * ("/proc/sys/net/ipv6/conf/IF/disable_ipv6"). 0 or -1. */
int VORNLnxIPv6ProcAction(const char* ifname, int action);

/* The DNS servers of the appliance's resolver settings of a family (4: "/etc/iproute2/config/
 * resolv4.conf", 6: "resolv6.conf"), the addresses of their "nameserver" lines, each once, in
 * file order; lines whose address does not parse are skipped. Appended to *list (allocated when
 * null). The number of servers (0 for a missing file) or -1. */
int VORNNetDNSServerListGet(int family, QLIBSZLIST** list);

/* Starts, stops or restarts a platform service: "/etc/rc.network" ACTION-SERVICE, e.g.
 * ("dnsmasq", "restart") runs "restart-dnsmasq". Service and action are plain words
 * (letters, digits, '-', '_'). 0 or -1. */
int QLIBNetService(const char* service, const char* action);

/* The platform's firewall and traffic-control reloads: "/etc/rc.network" "firewall-reload" and
 * "tc-reload". 0 or -1. */
int VORNFwRuleHup(void);
int VORNFwTcRuleHup(void);

#ifdef __cplusplus
}
#endif

#endif
