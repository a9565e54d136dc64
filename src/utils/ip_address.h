#ifndef VORN_UTILS_IP_ADDRESS_H
#define VORN_UTILS_IP_ADDRESS_H

#include <netinet/in.h>

#include <istream>
#include <string>
#include <utility>
#include <vector>

namespace vornwireless {
namespace utils {

// An IPv4 or IPv6 address kept as the text it was given; two addresses are equal when their
// texts are, so 10.0.0.1 and 010.0.0.1 differ. IPv4 texts also keep their binary form for the
// network arithmetic below.
class IPAddress {
  public:
    // (address text, prefix length) of each address of an interface.
    using InterfaceAddresses = std::vector<std::pair<std::string, int>>;

    IPAddress();
    explicit IPAddress(const std::string& text);

    // Keeps text verbatim when it parses as IPv4 (inet_aton forms) or IPv6, else becomes empty.
    IPAddress& operator=(const std::string& text);

    bool IsEmpty() const { return text_.empty(); }
    const std::string& ToString() const { return text_; }
    const char* ToCString() const { return text_.c_str(); }
    operator std::string() const { return text_; }
    operator const char*() const { return text_.c_str(); }

    bool operator==(const IPAddress& other) const { return text_ == other.text_; }
    bool operator!=(const IPAddress& other) const { return text_ != other.text_; }

    // In the order getifaddrs lists them.
    static InterfaceAddresses GetIPv4Address(const std::string& ifname);
    static InterfaceAddresses GetIPv4Network(const std::string& ifname);
    static InterfaceAddresses GetIPv6Address(const std::string& ifname);
    static InterfaceAddresses GetIPv6Network(const std::string& ifname);

    // The network part of a valid IPv6 text ("2001:db8:1:2::5", 64 -> "2001:db8:1:2::").
    // Throws std::logic_error when ipv6 does not parse.
    static std::string GetIPv6NetworkPart(const std::string& ipv6, int prefixLength);

  private:
    friend IPAddress GetNetwork(const IPAddress& ip, const IPAddress& mask);
    friend IPAddress GetIpAddressBegin(const IPAddress& network, const IPAddress& mask);
    friend IPAddress GetIpAddressEnd(const IPAddress& network, const IPAddress& mask);

    in_addr address_;  // network byte order; all ones until an IPv4 text is assigned
    std::string text_;
};

std::istream& operator>>(std::istream& in, IPAddress& ip);

// IPv4 network arithmetic; results carry dotted-quad text.
IPAddress GetNetwork(const IPAddress& ip, const IPAddress& mask);
// The network after the one holding ip (255.255.255.255/24 wraps to 0.0.0.0); empty when either
// text is not a dotted quad.
IPAddress GetNextNetwork(const IPAddress& ip, const IPAddress& mask);
// network + 1; the mask is not needed.
IPAddress GetIpAddressBegin(const IPAddress& network, const IPAddress& mask);
// The broadcast address minus one.
IPAddress GetIpAddressEnd(const IPAddress& network, const IPAddress& mask);

}  // namespace utils
}  // namespace vornwireless

#endif
