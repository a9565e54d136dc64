#ifndef VORN_WIFI_SETTINGS_FIELD_TEXT_H
#define VORN_WIFI_SETTINGS_FIELD_TEXT_H

#include <string>
#include <type_traits>

#include "utils/ip_address.h"
#include "utils/mac_address.h"
#include "wifi/settings/adapter_config.h"
#include "wifi/settings/enum_map.h"

// The text of a settings field as the setting files hold it.
namespace vornwireless {
namespace wifi {

std::string ToText(bool value);
std::string ToText(int value);
std::string ToText(const std::string& value);
std::string ToText(const vornwireless::utils::MacAddress& value);
std::string ToText(const vornwireless::utils::IPAddress& value);
std::string ToText(const Schedule& value);
template <typename E, typename = std::enable_if_t<std::is_enum<E>::value>>
std::string ToText(E value) {
    return EnumMap<E>::EnumToString(value);
}

// Each is false, leaving value alone, for a text that is not a valid value: a bool is true only
// for "yes" and never refused; an int is decimal and in range; a MAC must take canonical form;
// an IP is empty or parses; a schedule is 168 characters "0" or "1"; an enumeration word must
// be in its table (an unknown one is logged).
bool FromText(const std::string& text, bool& value);
bool FromText(const std::string& text, int& value);
bool FromText(const std::string& text, std::string& value);
bool FromText(const std::string& text, vornwireless::utils::MacAddress& value);
bool FromText(const std::string& text, vornwireless::utils::IPAddress& value);
bool FromText(const std::string& text, Schedule& value);
template <typename E, typename = std::enable_if_t<std::is_enum<E>::value>>
bool FromText(const std::string& text, E& value) {
    const E converted = EnumMap<E>::StringToEnum(text);
    if (!EnumMap<E>::IsKnown(text)) {
        return false;
    }
    value = converted;
    return true;
}

}  // namespace wifi
}  // namespace vornwireless

#endif
