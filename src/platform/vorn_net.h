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

#ifdef __cplusplus
}
#endif

#endif
