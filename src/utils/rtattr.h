#ifndef VORN_UTILS_RTATTR_H
#define VORN_UTILS_RTATTR_H

#include <linux/rtnetlink.h>

namespace vornwireless {
namespace utils {

// Indexes the routing attributes in the len bytes at rta (4-byte aligned): table[type] points at
// the first attribute of each type up to max, later duplicates and larger types are skipped, absent
// types are null. table must hold max + 1 entries.
// 0 when the block is well formed. -1 when an attribute is shorter than its own header (a
// zero-length one included) or runs past the block: the walk stops there, because nothing after a
// bad length can be trusted, and the caller drops the whole message.
int parse_rtattr(const rtattr* table[], int max, const rtattr* rta, int len);

}  // namespace utils
}  // namespace vornwireless

#endif
