#include "utils/rtattr.h"

#include <cstddef>

namespace vornwireless {
namespace utils {

int parse_rtattr(const rtattr* table[], int max, const rtattr* rta, int len) {
    if (table == nullptr || max < 0) {
        return -1;
    }
    for (int type = 0; type <= max; ++type) {
        table[type] = nullptr;
    }
    if (len < 0 || (rta == nullptr && len > 0)) {
        return -1;
    }
    const unsigned char* cursor = reinterpret_cast<const unsigned char*>(rta);
    std::size_t left = static_cast<std::size_t>(len);
    while (left > 0) {
        if (left < sizeof(rtattr)) {
            return -1;
        }
        const rtattr* attribute = reinterpret_cast<const rtattr*>(cursor);
        if (attribute->rta_len < sizeof(rtattr) || attribute->rta_len > left) {
            return -1;
        }
        if (attribute->rta_type <= max && table[attribute->rta_type] == nullptr) {
            table[attribute->rta_type] = attribute;
        }
        // The last attribute may come without its padding.
        const std::size_t step = RTA_ALIGN(attribute->rta_len);
        if (step >= left) {
            break;
        }
        cursor += step;
        left -= step;
    }
    return 0;
}

}  // namespace utils
}  // namespace vornwireless
