#include "platform/vorn_ipv6.h"

#include <net/if.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <exception>
#include <fstream>
#include <string>
#include <vector>

#include "platform/qlib_net.h"
#include "platform/qlibc_error.h"
#include "platform/root_path.h"
#include "utils/interface_name.h"

namespace {

using vorn::platform::RootPath;
using vornwireless::utils::IsValidInterfaceName;

const char kNetClass[] = "/sys/class/net/";
constexpr int kMaxInterfaces = 256;
const char kPppType[] = "512";
constexpr int kHardwareEthernet = 1;
constexpr int kMacLength = 6;
// 2000-01-01 00:00:00 UTC, the epoch of DUID-LLT times.
constexpr long kDuidEpoch = 946684800L;

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

bool IsValidName(const char* ifname) {
    return ifname != nullptr && IsValidInterfaceName(ifname);
}

// The first line of an interface's attribute file, "" when it cannot be read.
std::string Attribute(const std::string& ifname, const char* name) {
    std::ifstream in(RootPath(kNetClass + ifname + "/" + name));
    std::string line;
    std::getline(in, line);
    return line;
}

bool CopyOut(const std::string& text, char* buffer, int size) {
    if (buffer == nullptr || size <= 0 || text.size() >= static_cast<size_t>(size)) {
        return false;
    }
    std::memcpy(buffer, text.c_str(), text.size() + 1);
    return true;
}

int HexDigit(char c) {
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    if (c >= 'A' && c <= 'F') {
        return c - 'A' + 10;
    }
    return -1;
}

// "02:76:6f:72:6e:01" -> six bytes; anything else is refused.
bool ParseMac(const std::string& text, std::vector<unsigned char>& bytes) {
    if (text.size() != 3 * kMacLength - 1) {
        return false;
    }
    for (int i = 0; i < kMacLength; ++i) {
        const int high = HexDigit(text[3 * i]);
        const int low = HexDigit(text[3 * i + 1]);
        if (high < 0 || low < 0 || (i + 1 < kMacLength && text[3 * i + 2] != ':')) {
            return false;
        }
        bytes.push_back(static_cast<unsigned char>(high * 16 + low));
    }
    return true;
}

void AppendBigEndian(std::vector<unsigned char>& bytes, unsigned long value, int length) {
    for (int shift = 8 * (length - 1); shift >= 0; shift -= 8) {
        bytes.push_back(static_cast<unsigned char>((value >> shift) & 0xff));
    }
}

// dhclient's quoted-string form of binary data.
std::string LeaseText(const std::vector<unsigned char>& bytes) {
    std::string text;
    for (unsigned char byte : bytes) {
        if (byte == '"' || byte == '\\') {
            text += '\\';
            text += static_cast<char>(byte);
        } else if (byte >= 0x20 && byte < 0x7f) {
            text += static_cast<char>(byte);
        } else {
            char octal[5];
            std::snprintf(octal, sizeof(octal), "\\%03o", byte);
            text += octal;
        }
    }
    return text;
}

}  // namespace

extern "C" {

int VORNPPPoeIntfGet(char* buffer, int size) {
    try {
        std::vector<QLIB_NET_IF_INFO> interfaces(kMaxInterfaces);
        const int count = QLIBNetGetInterfaceInfo(interfaces.data(), kMaxInterfaces, 0);
        for (int i = 0; i < count; ++i) {
            const std::string name = interfaces[i].name;
            if (Attribute(name, "type") == kPppType) {
                return CopyOut(name, buffer, size) ? 0 : Fail(QLIBC_ERR_INVALID_ARG);
            }
        }
        return Fail(QLIBC_ERR_NOT_FOUND);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

int VORNNetIPv6Enable(const char* ifname) {
    if (!IsValidName(ifname)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    std::ofstream out(RootPath(std::string("/proc/sys/net/ipv6/conf/") + ifname + "/disable_ipv6"));
    out << "0\n";
    out.close();
    return out.fail() ? Fail(QLIBC_ERR_FILE_IO) : 0;
}

int VORNNetIfIsUp(const char* ifname) {
    if (!IsValidName(ifname)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    const std::string state = Attribute(ifname, "operstate");
    if (state == "unknown") {
        return (std::strtoul(Attribute(ifname, "flags").c_str(), nullptr, 16) & IFF_UP) ? 1 : 0;
    }
    return state == "up" ? 1 : 0;
}

int GenDUID(const char* ifname, int type, char* buffer, int size) {
    if (!IsValidName(ifname) || (type != VORN_DUID_LLT && type != VORN_DUID_LL)) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        std::vector<unsigned char> mac;
        if (!ParseMac(Attribute(ifname, "address"), mac)) {
            return Fail(QLIBC_ERR_FORMAT);
        }
        std::vector<unsigned char> duid;
        AppendBigEndian(duid, static_cast<unsigned long>(type), 2);
        AppendBigEndian(duid, kHardwareEthernet, 2);
        if (type == VORN_DUID_LLT) {
            AppendBigEndian(duid, static_cast<unsigned long>(std::time(nullptr) - kDuidEpoch), 4);
        }
        duid.insert(duid.end(), mac.begin(), mac.end());
        return CopyOut(LeaseText(duid), buffer, size) ? 0 : Fail(QLIBC_ERR_INVALID_ARG);
    } catch (const std::exception&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

}  // extern "C"
