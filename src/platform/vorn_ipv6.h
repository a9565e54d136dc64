#ifndef VORN_PLATFORM_VORN_IPV6_H
#define VORN_PLATFORM_VORN_IPV6_H

#ifdef __cplusplus
extern "C" {
#endif

/* The current PPPoE interface: the first interface of "/sys/class/net" (name order) whose "type"
 * is 512 (ARPHRD_PPP). Its name into buffer; 0, or -1 when there is none (QLIBC_ERR_NOT_FOUND) or
 * it does not fit (QLIBC_ERR_INVALID_ARG). */
int VORNPPPoeIntfGet(char* buffer, int size);

/* Lets the kernel run IPv6 on the interface: "0" into
 * "/proc/sys/net/ipv6/conf/IF/disable_ipv6". 0 or -1 (a bad name, no such interface). */
int VORNNetIPv6Enable(const char* ifname);

/* 1 when the interface is up: operstate "up", or "unknown" (PPP and tunnels report no state) with
 * the IFF_UP bit in "flags". 0 when it is not, -1 for a bad name. */
int VORNNetIfIsUp(const char* ifname);

/* DUID kinds of GenDUID. */
enum { VORN_DUID_LLT = 1, VORN_DUID_LL = 3 };
/* A DHCPv6 client identifier built from the interface's Ethernet MAC ("/sys/class/net/IF/address"):
 * DUID-LLT (with the seconds since 2000-01-01 UTC) or DUID-LL. Written into buffer in the form of
 * the value of dhclient's "default-duid" lease line without its quotes: printable bytes as they
 * are ('"' and '\' escaped with '\'), every other byte as '\' and three octal digits. 0, or -1
 * for a bad name or type, an unreadable or malformed MAC, or a buffer too small. */
int GenDUID(const char* ifname, int type, char* buffer, int size);

#ifdef __cplusplus
}
#endif

#endif
