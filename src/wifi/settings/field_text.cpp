#include "wifi/settings/field_text.h"

#include "utils/decimal.h"

namespace vornwireless {
namespace wifi {

std::string ToText(bool value) {
    return value ? "yes" : "no";
}

std::string ToText(int value) {
    return std::to_string(value);
}

std::string ToText(const std::string& value) {
    return value;
}

std::string ToText(const vornwireless::utils::MacAddress& value) {
    return value.ToString();
}

std::string ToText(const vornwireless::utils::IPAddress& value) {
    return value.ToString();
}

std::string ToText(const Schedule& value) {
    std::string text;
    for (bool hour : value) {
        text += hour ? '1' : '0';
    }
    return text;
}

bool FromText(const std::string& text, bool& value) {
    value = text == "yes";
    return true;
}

bool FromText(const std::string& text, int& value) {
    return vornwireless::utils::ParseDecimal(text, value);
}

bool FromText(const std::string& text, std::string& value) {
    value = text;
    return true;
}

bool FromText(const std::string& text, vornwireless::utils::MacAddress& value) {
    const vornwireless::utils::MacAddress mac(text);
    if (!mac.IsFormalized()) {
        return false;
    }
    value = mac;
    return true;
}

bool FromText(const std::string& text, vornwireless::utils::IPAddress& value) {
    const vornwireless::utils::IPAddress ip(text);
    if (ip.IsEmpty() != text.empty()) {
        return false;
    }
    value = ip;
    return true;
}

bool FromText(const std::string& text, Schedule& value) {
    if (text.size() != kScheduleHours || text.find_first_not_of("01") != std::string::npos) {
        return false;
    }
    for (std::size_t hour = 0; hour < kScheduleHours; ++hour) {
        value[hour] = text[hour] == '1';
    }
    return true;
}

}  // namespace wifi
}  // namespace vornwireless
