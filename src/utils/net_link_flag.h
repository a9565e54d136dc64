#ifndef VORN_UTILS_NET_LINK_FLAG_H
#define VORN_UTILS_NET_LINK_FLAG_H

namespace vornwireless {
namespace utils {

// A pid file that tells other processes a link change is being handled.
void SetNetLinkIsProcessing();
void UnsetNetLinkIsProcessing();
// True while the flag file names a live process.
bool IsNetLinkProcessing();

}  // namespace utils
}  // namespace vornwireless

#endif
