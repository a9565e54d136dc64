#include "utils/decimal.h"

#include <cerrno>
#include <climits>
#include <cstdlib>

namespace vornwireless {
namespace utils {

bool ParseDecimal(const std::string& text, int& value) {
    if (text.empty() || text.find_first_not_of("-0123456789") != std::string::npos) {
        return false;
    }
    char* end = nullptr;
    errno = 0;
    const long number = std::strtol(text.c_str(), &end, 10);
    if (errno != 0 || *end != '\0' || number < INT_MIN || number > INT_MAX) {
        return false;
    }
    value = static_cast<int>(number);
    return true;
}

}  // namespace utils
}  // namespace vornwireless
