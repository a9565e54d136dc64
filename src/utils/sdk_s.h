#ifndef VORN_UTILS_SDK_S_H
#define VORN_UTILS_SDK_S_H

#include "platform/qlib_net.h"
#include "platform/qlib_plugin.h"
#include "platform/vorn_net.h"

namespace vornwireless {
namespace sdk_s {

// Platform calls that must not run concurrently within one process (the netlink thread and the
// request thread both reach them): each wrapper holds one process-wide mutex around its call and
// returns the call's result unchanged.

int QLIBCExec_S(const char* prog, const char* a1, const char* a2, const char* a3, const char* a4);
int QLIBNetIfLinkDownEvent_S(const char* ifname);
int QLIBNetIfLinkUpEvent_S(const char* ifname);
int QLIBPluginAction_S(int action, QLIBPLUGIN* handle);
// action 0: link up, 1: link down.
int NetRoutetableHandler_S(int action, const char* ifname);
int VORNNetIFGetInfo_S(const char* ifname, int flags, VORN_NET_IF_CONFIG* info);
int BlVORNLnxIsDHCP_S(const char* ifname);
int VORNNetSetCard1_S(const VORN_NET_IF_CONFIG* info, int flags);
int VORNNetDNSUpdate_S();

}  // namespace sdk_s
}  // namespace vornwireless

#endif
