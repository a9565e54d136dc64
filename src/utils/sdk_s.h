#ifndef VORN_UTILS_SDK_S_H
#define VORN_UTILS_SDK_S_H

namespace vornwireless {
namespace sdk_s {

// Platform calls that must not run concurrently within one process (the netlink thread and the
// request thread both reach them): each wrapper holds one process-wide mutex around its call and
// returns the call's result unchanged.

int QLIBCExec_S(const char* prog, const char* a1, const char* a2, const char* a3, const char* a4);

}  // namespace sdk_s
}  // namespace vornwireless

#endif
