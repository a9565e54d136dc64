#include "utils/interface_name.h"

#include "utils/log.h"

namespace vornwireless {
namespace utils {

bool IsValidInterfaceName(const std::string& name) {
    if (name.empty() || name.size() > 15 || name == "." || name == "..") {
        return false;
    }
    for (char c : name) {
        const bool alnum =
            (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9');
        if (!alnum && std::string("-_.:@+").find(c) == std::string::npos) {
            return false;
        }
    }
    return true;
}

bool CheckInterfaceName(const std::string& name) {
    if (!IsValidInterfaceName(name)) {
        VORN_LOG(LOG_ERR, "Refused interface name [%s]", name.c_str());
        return false;
    }
    return true;
}

}  // namespace utils
}  // namespace vornwireless
