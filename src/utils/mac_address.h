#ifndef VORN_UTILS_MAC_ADDRESS_H
#define VORN_UTILS_MAC_ADDRESS_H

#include <istream>
#include <string>

namespace vornwireless {
namespace utils {

// A hardware address as text, in colon form once formalized. The case of the digits is kept and
// equality is byte-wise, so AA:BB:CC:DD:EE:FF and aa:bb:cc:dd:ee:ff differ.
class MacAddress {
  public:
    MacAddress() = default;
    // Stores text and formalizes it when it can; a text that cannot be is kept as given.
    explicit MacAddress(const std::string& text);
    MacAddress& operator=(const std::string& text);

    // Six two-digit hex groups joined by ':'.
    bool IsFormalized() const { return IsFormalized(text_); }
    // The same test of any text, without making (and so formalizing and logging) an address.
    static bool IsFormalized(const std::string& text);
    // Exactly twelve hex digits; logs why not.
    bool IsFormalizable() const;
    // 0 when the text is (now) formalized, -1 when it is left as it was.
    int Formalize();

    const std::string& ToString() const { return text_; }
    const char* ToCString() const { return text_.c_str(); }
    operator std::string() const { return text_; }
    operator const char*() const { return text_.c_str(); }

    bool operator==(const MacAddress& other) const { return text_ == other.text_; }

    // Adds n to the last octet modulo 255 (not 256) without carry: ..:fe + 1 gives ..:00.
    // The result is lower case.
    MacAddress operator+(int n) const;

  private:
    std::string text_;
};

std::istream& operator>>(std::istream& in, MacAddress& mac);

}  // namespace utils
}  // namespace vornwireless

#endif
