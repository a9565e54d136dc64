#ifndef VORN_UTILS_DECIMAL_H
#define VORN_UTILS_DECIMAL_H

#include <string>

namespace vornwireless {
namespace utils {

// A whole decimal int, optionally negative, and nothing else (no blanks, no "+", no overflow).
// False, with value unchanged, for anything else.
bool ParseDecimal(const std::string& text, int& value);

}  // namespace utils
}  // namespace vornwireless

#endif
