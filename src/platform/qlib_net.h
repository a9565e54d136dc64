#ifndef VORN_PLATFORM_QLIB_NET_H
#define VORN_PLATFORM_QLIB_NET_H

#ifdef __cplusplus
extern "C" {
#endif

/* One network interface as the system shows it. */
typedef struct QLIB_NET_IF_INFO {
    char name[16];
    char ipv4[16]; /* first IPv4 address, dotted; empty when it has none */
    int link;      /* QLIB_NET_LINK_UP or QLIB_NET_LINK_DOWN */
} QLIB_NET_IF_INFO;

enum { QLIB_NET_LINK_DOWN = 1, QLIB_NET_LINK_UP = 2 };
/* What QLIBNetGetInterfaceInfo fills in besides the name. */
enum { QLIB_NET_INFO_LINK = 1, QLIB_NET_INFO_IPV4 = 2 };

/* Fills at most max records with the system's interfaces (the entries of /sys/class/net under the
 * root prefix, in name order; link from their operstate, "up" meaning QLIB_NET_LINK_UP; IPv4 from
 * "/sbin/ip -4 -o addr show dev NAME"). Returns the number filled, or -1 (QLIBCErrGet tells). */
int QLIBNetGetInterfaceInfo(QLIB_NET_IF_INFO* array, int max, int flags);
/* 1 when ifname is a bridge port (has /sys/class/net/IF/brport), 0 when not, -1 for a bad name. */
int QLIBNetBridgeIfIsSlave(const char* ifname);
/* The platform's handling of a link change: runs "/etc/rc.network" "link-up"|"link-down" IF. */
int QLIBNetIfLinkUpEvent(const char* ifname);
int QLIBNetIfLinkDownEvent(const char* ifname);
/* The platform's route-table handler: runs "/etc/rc.network" "route-table-up"|"route-table-down"
 * IF for action 0 (link up) or 1 (link down). */
int NetRoutetableHandler(int action, const char* ifname);

/* The network topology, key "net_topology" of "/etc/vorninfo.conf", as a code (flags: 0):
 * "router" 3, "bridge" 2, "client" 1, "repeater" 4. Callers act on "above 1" (the appliance
 * serves a local network) and on 3 (it also runs the DHCP server). -1 when the key is missing
 * (QLIBC_ERR_NOT_FOUND) or holds any other value (QLIBC_ERR_FORMAT). */
int QLIBNetTopologyGet(int flags);

/* Every call taking an interface name refuses (-1, QLIBC_ERR_INVALID_ARG) one that is not a valid
 * interface name, before it reaches a path or a program. All return 0 on success. */

#ifdef __cplusplus
}
#endif

#endif
