#ifndef VORN_PLATFORM_VORN_NET_H
#define VORN_PLATFORM_VORN_NET_H

#ifdef __cplusplus
extern "C" {
#endif

/* An interface's stored settings: its "/etc/sysconfig/network-scripts/ifcfg-IF" file. */
typedef struct VORN_NET_IF_CONFIG {
    char name[16];    /* DEVICE */
    int dhcp;         /* BOOTPROTO is "dhcp" */
    char ipv4[16];    /* IPADDR */
    char netmask[16]; /* NETMASK */
    char gateway[16]; /* GATEWAY */
} VORN_NET_IF_CONFIG;

/* 1 when the interface's ifcfg file says BOOTPROTO=dhcp (any case), else 0 (also for a missing
 * file or a bad name). */
int BlVORNLnxIsDHCP(const char* ifname);
/* Reads the interface's ifcfg file into info (flags: 0); absent keys leave their fields empty, a
 * missing DEVICE means ifname. 0, or -1 when it cannot be read or a value is malformed (not a
 * dotted quad, not an interface name, too long). */
int VORNNetIFGetInfo(const char* ifname, int flags, VORN_NET_IF_CONFIG* info);
/* Writes info into the interface's ifcfg file (other keys kept; an empty address field removes
 * its key; BOOTPROTO becomes "dhcp" or "static" only when that differs from the file) and
 * applies it by running "/etc/rc.network" "restart-if" IF (flags: 0). 0 or -1. */
int VORNNetSetCard1(const VORN_NET_IF_CONFIG* info, int flags);

/* The running IPv4 default gateway ("/sbin/ip -4 route show table main", the "default via" line):
 * its address into buffer, "" when there is none. 0, or -1 when it cannot be read. */
int VORNNetDefaultGatewayGet(char* buffer, int size);
/* Replaces the running default route with one via gateway ("/sbin/ip -4 route replace default
 * via GW"); a null or empty gateway deletes it ("/sbin/ip -4 route del default", run only when
 * one is present). A gateway that is not a dotted quad is refused. */
int VORNNetDefaultGatewaySet(const char* gateway);
/* The persistent default gateway: key "GATEWAY" of "/etc/sysconfig/network" ("" when unset or
 * the file is missing; -1 when it holds something else than a dotted quad). Setting a null or
 * empty gateway removes the key. */
int VORNNetDefaultGatewayGetConf(char* buffer, int size);
int VORNNetDefaultGatewaySetConf(const char* gateway);

/* Regenerates the system resolver file "/etc/resolv.conf" from "/etc/iproute2/config/resolv4.conf"
 * and "/etc/iproute2/config/resolv6.conf": their lines, IPv4 first, each line once (a missing file
 * counts as empty). Replaced atomically. 0 or -1. */
int VORNNetDNSUpdate(void);

/* The system event log: appends one line to "/var/log/vorn_event.log": the time, level, category,
 * the event code in hex (0x%08X) and the text arguments (a null pointer ends them). 0 or -1. */
int VORNLogSet1(int level, int category, unsigned int code, ...);

/* Host discovery of appliances of the system's family: runs the platform's discovery program
 * "/usr/vorn/bin/fhost" with "--dump" and a file to write, waits for it and renames the file to
 * "/tmp/vorncv.list.tmp", so the list there is always whole. The program writes one line per host
 * found ("model,model name,name,IPv4,MAC"). 0; -1 when the program is missing (logged,
 * QLIBC_ERR_NOT_FOUND), does not exit with 0 (QLIBC_ERR_EXEC) or the rename fails. */
int VORNFHOSTDumpHost(void);

/* IPv6 settings of an interface, kept in its "/etc/sysconfig/network-scripts/ifcfg-IF" file
 * with the initscripts keys IPV6INIT, IPV6FORWARDING, IPV6ADDR, IPV6_AUTOCONF, DHCPV6C and
 * DHCPV6C_OPTIONS ("yes" compared without regard to case). */
enum {
    VORN_NET_IPV6_TYPE_OFF = 0,    /* IPV6INIT is not "yes" */
    VORN_NET_IPV6_TYPE_ROUTER = 1, /* IPV6FORWARDING=yes: the system routes on it itself */
    VORN_NET_IPV6_TYPE_AUTO = 2,   /* addresses from router advertisements (and DHCPv6) */
    VORN_NET_IPV6_TYPE_STATIC = 3  /* IPV6ADDR, with neither IPV6_AUTOCONF nor DHCPV6C "yes" */
};
/* How an automatically configured interface gets its addresses. */
enum {
    VORN_NET_IPV6_MODE_AUTOCONF = 0, /* IPV6_AUTOCONF=yes, DHCPV6C=no */
    VORN_NET_IPV6_MODE_MANAGED = 2,  /* stateful DHCPv6: IPV6_AUTOCONF=no, DHCPV6C=yes */
    VORN_NET_IPV6_MODE_OTHER = 4     /* stateless DHCPv6 too: IPV6_AUTOCONF=yes, DHCPV6C=yes,
                                        DHCPV6C_OPTIONS=-S */
};
typedef struct VORN_NET_IPV6_CONFIG {
    int type; /* VORN_NET_IPV6_TYPE_* */
    int mode; /* VORN_NET_IPV6_MODE_*: MANAGED when DHCPV6C=yes (OTHER with a "-S" word in
                 DHCPV6C_OPTIONS), else AUTOCONF */
} VORN_NET_IPV6_CONFIG;

/* Reads the interface's IPv6 settings. 0, or -1 when the file cannot be read or the name is bad. */
int VORNNetIPv6ConfGet(const char* ifname, VORN_NET_IPV6_CONFIG* config);
/* Writes the keys of mode (a VORN_NET_IPV6_MODE_* value; other keys kept) into the interface's
 * existing ifcfg file and applies them by running "/etc/rc.network" "ipv6-restart" IF. The three
 * int arguments are reserved: pass 0. 0, or -1 for a bad mode or name, a missing file, a failed
 * write or a failed restart. */
int VORNNetIPv6ConfSet(int mode, const char* ifname, int reserved1, int reserved2, int reserved3);

/* Applies the PPPoE relay setting of every interface that has an
 * "/etc/sysconfig/network-scripts/ifcfg-IF" file: "/etc/rc.network" "start-pppoe-relay" IF when
 * it holds PPPOE_RELAY="yes", "stop-pppoe-relay" IF when it holds the key with another value,
 * nothing without the key. A file whose name is not an interface name is logged and skipped.
 * Every interface is tried; 0, or -1 when a file could not be read or a call failed (logged). */
int VORNNetApplyPPPoERelayConfigAll(void);

#ifdef __cplusplus
}
#endif

#endif
