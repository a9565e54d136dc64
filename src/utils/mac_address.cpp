#include "utils/mac_address.h"

#include <algorithm>
#include <cctype>
#include <cstdio>

#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr std::string::size_type kFormalizedLength = 17;
constexpr std::string::size_type kBareLength = 12;
constexpr int kOctetModulus = 255;

bool IsHexDigit(char c) {
    return std::isxdigit(static_cast<unsigned char>(c)) != 0;
}

}  // namespace

MacAddress::MacAddress(const std::string& text) {
    *this = text;
}

MacAddress& MacAddress::operator=(const std::string& text) {
    text_ = text;
    Formalize();
    return *this;
}

bool MacAddress::IsFormalized(const std::string& text) {
    if (text.size() != kFormalizedLength) {
        return false;
    }
    for (std::string::size_type i = 0; i < text.size(); ++i) {
        const bool separatorPosition = i % 3 == 2;
        if (separatorPosition ? text[i] != ':' : !IsHexDigit(text[i])) {
            return false;
        }
    }
    return true;
}

bool MacAddress::IsFormalizable() const {
    if (text_.size() != kBareLength) {
        VORN_LOG(LOG_ERR, "Bad mac addr length (%d)", static_cast<int>(text_.size()));
        return false;
    }
    if (!std::all_of(text_.begin(), text_.end(), IsHexDigit)) {
        VORN_LOG(LOG_ERR, "Bad mac addr [%s]", text_.c_str());
        return false;
    }
    return true;
}

int MacAddress::Formalize() {
    if (IsFormalized()) {
        return 0;
    }
    if (!IsFormalizable()) {
        return -1;
    }
    std::string formal;
    for (std::string::size_type i = 0; i < text_.size(); i += 2) {
        if (i != 0) {
            formal += ':';
        }
        formal.append(text_, i, 2);
    }
    text_ = formal;
    return 0;
}

MacAddress MacAddress::operator+(int n) const {
    unsigned char octets[6] = {};
    std::sscanf(text_.c_str(), "%2hhx:%2hhx:%2hhx:%2hhx:%2hhx:%2hhx", &octets[0], &octets[1],
                &octets[2], &octets[3], &octets[4], &octets[5]);
    // Wide enough not to overflow; a negative remainder is moved into 0..254 so that the result
    // stays a MAC address.
    long long last = (static_cast<long long>(octets[5]) + n) % kOctetModulus;
    if (last < 0) {
        last += kOctetModulus;
    }
    char text[kFormalizedLength + 1];
    std::snprintf(text, sizeof(text), "%02x:%02x:%02x:%02x:%02x:%02x", octets[0], octets[1],
                  octets[2], octets[3], octets[4], static_cast<unsigned>(last));
    return MacAddress(text);
}

std::istream& operator>>(std::istream& in, MacAddress& mac) {
    std::string word;
    in >> word;
    mac = word;
    return in;
}

}  // namespace utils
}  // namespace vornwireless
