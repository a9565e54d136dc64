#include "utils/ip_address.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <sys/socket.h>

#include <algorithm>
#include <cctype>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <stdexcept>

#include "platform/qlibc_str.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr int kIPv6Bits = 128;

// inet_aton stops at the first blank and accepts whatever follows, so "1.2.3.4; reboot" would
// pass as an address and reach shell lines verbatim. Such texts are refused outright.
bool HoldsBlankOrNul(const std::string& text) {
    return std::any_of(text.begin(), text.end(), [](char c) {
        return c == '\0' || std::isspace(static_cast<unsigned char>(c));
    });
}

IPAddress FromHostOrder(uint32_t value) {
    char text[20];
    std::snprintf(text, sizeof(text), "%u.%u.%u.%u", static_cast<unsigned>(value >> 24 & 0xFF),
                  static_cast<unsigned>(value >> 16 & 0xFF),
                  static_cast<unsigned>(value >> 8 & 0xFF), static_cast<unsigned>(value & 0xFF));
    return IPAddress(text);
}

bool ParseOne(uint32_t& one) {
    const char* const kOne = "0.0.0.1";
    in_addr parsed;
    if (inet_aton(kOne, &parsed) == 0) {
        VORN_LOG(LOG_ERR, "Invalid address (%s)", kOne);
        return false;
    }
    one = ntohl(parsed.s_addr);
    return true;
}

bool ToDottedValue(const IPAddress& ip, uint32_t& value) {
    unsigned int parts[4];
    if (cQLIBISepIP(ip.ToCString(), parts, 4) != 4) {
        return false;
    }
    value = static_cast<uint32_t>(parts[0]) << 24 | static_cast<uint32_t>(parts[1]) << 16 |
            static_cast<uint32_t>(parts[2]) << 8 | static_cast<uint32_t>(parts[3]);
    return true;
}

int CountOneBits(uint32_t value) {
    int count = 0;
    for (; value != 0; value &= value - 1) {
        ++count;
    }
    return count;
}

// Leading one bits: whole 0xFF bytes plus the bits of the first byte that is not.
int IPv6PrefixLength(const in6_addr& mask) {
    int length = 0;
    for (unsigned char byte : mask.s6_addr) {
        length += CountOneBits(byte);
        if (byte != 0xFF) {
            break;
        }
    }
    return length;
}

int PrefixLength(int family, const sockaddr* netmask) {
    if (netmask == nullptr) {
        return -1;
    }
    if (family == AF_INET) {
        sockaddr_in mask;
        std::memcpy(&mask, netmask, sizeof(mask));
        return CountOneBits(ntohl(mask.sin_addr.s_addr));
    }
    sockaddr_in6 mask;
    std::memcpy(&mask, netmask, sizeof(mask));
    return IPv6PrefixLength(mask.sin6_addr);
}

// The address (or, for networkOnly, address AND netmask) of one getifaddrs entry as text.
std::string ToText(int family, const sockaddr* address, const sockaddr* netmask, bool networkOnly) {
    if (networkOnly && netmask == nullptr) {
        return std::string();
    }
    char text[INET6_ADDRSTRLEN];
    const char* converted = nullptr;
    if (family == AF_INET) {
        sockaddr_in value;
        std::memcpy(&value, address, sizeof(value));
        if (networkOnly) {
            sockaddr_in mask;
            std::memcpy(&mask, netmask, sizeof(mask));
            value.sin_addr.s_addr &= mask.sin_addr.s_addr;
        }
        converted = inet_ntop(AF_INET, &value.sin_addr, text, INET_ADDRSTRLEN);
    } else {
        sockaddr_in6 value;
        std::memcpy(&value, address, sizeof(value));
        if (networkOnly) {
            sockaddr_in6 mask;
            std::memcpy(&mask, netmask, sizeof(mask));
            for (size_t i = 0; i < sizeof(value.sin6_addr.s6_addr); ++i) {
                value.sin6_addr.s6_addr[i] &= mask.sin6_addr.s6_addr[i];
            }
        }
        converted = inet_ntop(AF_INET6, &value.sin6_addr, text, INET6_ADDRSTRLEN);
    }
    return converted != nullptr ? std::string(converted) : std::string();
}

IPAddress::InterfaceAddresses ListInterface(const std::string& ifname, int family,
                                            bool networkOnly) {
    IPAddress::InterfaceAddresses found;
    ifaddrs* list = nullptr;
    if (getifaddrs(&list) != 0) {
        VORN_LOG(LOG_ERR, "Unable to get IP of [%s]", ifname.c_str());
        return found;
    }
    for (const ifaddrs* entry = list; entry != nullptr; entry = entry->ifa_next) {
        if (entry->ifa_name == nullptr || ifname != entry->ifa_name || entry->ifa_addr == nullptr ||
            entry->ifa_addr->sa_family != family) {
            continue;
        }
        const std::string text = ToText(family, entry->ifa_addr, entry->ifa_netmask, networkOnly);
        if (text.empty()) {
            VORN_LOG(LOG_WARNING, "Unable to convert address/network to text form");
            continue;
        }
        const int length = PrefixLength(family, entry->ifa_netmask);
        if (length < 0) {
            VORN_LOG(LOG_WARNING, "Unable to convert netmask to prefix length (addr: %s)",
                     text.c_str());
            continue;
        }
        found.emplace_back(text, length);
    }
    freeifaddrs(list);
    return found;
}

}  // namespace

IPAddress::IPAddress() : text_() {
    address_.s_addr = 0xFFFFFFFFu;
}

IPAddress::IPAddress(const std::string& text) : IPAddress() {
    *this = text;
}

IPAddress& IPAddress::operator=(const std::string& text) {
    in_addr ipv4;
    in6_addr ipv6;
    if (HoldsBlankOrNul(text)) {
        text_.clear();
    } else if (inet_aton(text.c_str(), &ipv4) != 0) {
        address_ = ipv4;
        text_ = text;
    } else if (inet_pton(AF_INET6, text.c_str(), &ipv6) == 1) {
        text_ = text;
    } else {
        text_.clear();
    }
    return *this;
}

std::istream& operator>>(std::istream& in, IPAddress& ip) {
    std::string word;
    in >> word;
    ip = word;
    return in;
}

IPAddress::InterfaceAddresses IPAddress::GetIPv4Address(const std::string& ifname) {
    return ListInterface(ifname, AF_INET, false);
}

IPAddress::InterfaceAddresses IPAddress::GetIPv4Network(const std::string& ifname) {
    return ListInterface(ifname, AF_INET, true);
}

IPAddress::InterfaceAddresses IPAddress::GetIPv6Address(const std::string& ifname) {
    return ListInterface(ifname, AF_INET6, false);
}

IPAddress::InterfaceAddresses IPAddress::GetIPv6Network(const std::string& ifname) {
    return ListInterface(ifname, AF_INET6, true);
}

std::string IPAddress::GetIPv6NetworkPart(const std::string& ipv6, int prefixLength) {
    // Out-of-range lengths are clamped so that the mask never runs past its 16 bytes.
    const int bits = std::clamp(prefixLength, 0, kIPv6Bits);
    unsigned char mask[16] = {};
    std::fill(mask, mask + bits / 8, 0xFF);
    if (bits % 8 != 0) {
        mask[bits / 8] = static_cast<unsigned char>(0xFF << (8 - bits % 8));
    }

    in6_addr address;
    if (inet_pton(AF_INET6, ipv6.c_str(), &address) < 1) {
        VORN_LOG(LOG_ERR, "Unable to convert %s to binary form", ipv6.c_str());
        throw std::logic_error("not an IPv6 address: " + ipv6);
    }
    for (size_t i = 0; i < sizeof(mask); ++i) {
        address.s6_addr[i] &= mask[i];
    }
    char text[INET6_ADDRSTRLEN];
    return inet_ntop(AF_INET6, &address, text, sizeof(text)) != nullptr ? std::string(text)
                                                                        : std::string();
}

IPAddress GetNetwork(const IPAddress& ip, const IPAddress& mask) {
    return FromHostOrder(ntohl(ip.address_.s_addr & mask.address_.s_addr));
}

IPAddress GetNextNetwork(const IPAddress& ip, const IPAddress& mask) {
    uint32_t address = 0;
    uint32_t netmask = 0;
    if (!ToDottedValue(ip, address) || !ToDottedValue(mask, netmask)) {
        return IPAddress();
    }
    // Unsigned wrap-around: subtracting the mask adds the block size.
    return FromHostOrder((address - netmask) & netmask);
}

IPAddress GetIpAddressBegin(const IPAddress& network, const IPAddress& /*mask*/) {
    uint32_t one = 0;
    if (!ParseOne(one)) {
        return IPAddress();
    }
    return FromHostOrder(ntohl(network.address_.s_addr) + one);
}

IPAddress GetIpAddressEnd(const IPAddress& network, const IPAddress& mask) {
    uint32_t one = 0;
    if (!ParseOne(one)) {
        return IPAddress();
    }
    return FromHostOrder((~ntohl(mask.address_.s_addr) - one) | ntohl(network.address_.s_addr));
}

}  // namespace utils
}  // namespace vornwireless
