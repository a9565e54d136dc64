#include "platform/qlibc_str.h"

#include <arpa/inet.h>

#include <cctype>
#include <cstdio>
#include <cstring>
#include <string>

namespace {

bool ParseIPv4(const std::string& text, uint32_t& hostOrder) {
    in_addr parsed;
    if (inet_pton(AF_INET, text.c_str(), &parsed) != 1) {
        return false;
    }
    hostOrder = ntohl(parsed.s_addr);
    return true;
}

// The number of leading ones of a mask, or -1 when a zero bit is followed by a one.
int PrefixLength(uint32_t mask) {
    const uint32_t inverted = ~mask;
    if ((inverted & (inverted + 1)) != 0) {
        return -1;
    }
    int length = 0;
    for (uint32_t bit = 0x80000000u; bit != 0 && (mask & bit) != 0; bit >>= 1) {
        ++length;
    }
    return length;
}

}  // namespace

extern "C" {

char* QLIBCStrTrimSpace(char* text) {
    if (text == nullptr) {
        return nullptr;
    }
    size_t start = 0;
    while (text[start] != '\0' && std::isspace(static_cast<unsigned char>(text[start]))) {
        ++start;
    }
    size_t end = std::strlen(text);
    while (end > start && std::isspace(static_cast<unsigned char>(text[end - 1]))) {
        --end;
    }
    std::memmove(text, text + start, end - start);
    text[end - start] = '\0';
    return text;
}

char* QLIBCStrSep(char** cursor, const char* delims) {
    if (cursor == nullptr || *cursor == nullptr || delims == nullptr) {
        return nullptr;
    }
    char* token = *cursor;
    char* end = token + std::strcspn(token, delims);
    if (*end == '\0') {
        *cursor = nullptr;
    } else {
        *end = '\0';
        *cursor = end + 1;
    }
    return token;
}

int cQLIBISepIP(const char* text, unsigned int* parts, int maxParts) {
    if (text == nullptr) {
        return -1;
    }
    int count = 0;
    const char* p = text;
    for (;;) {
        unsigned int value = 0;
        int digits = 0;
        while (std::isdigit(static_cast<unsigned char>(*p))) {
            value = value * 10 + static_cast<unsigned int>(*p - '0');
            if (++digits > 3 || value > 255) {
                return -1;
            }
            ++p;
        }
        if (digits == 0) {
            return -1;
        }
        if (parts != nullptr && count < maxParts) {
            parts[count] = value;
        }
        ++count;
        if (*p == '\0') {
            return count;
        }
        if (*p != '.') {
            return -1;
        }
        ++p;
    }
}

int ErrQLIBIpMaskToSubnet(const char* ipMask, char* out, int size) {
    if (ipMask == nullptr || out == nullptr || size <= 0) {
        return -1;
    }
    const char* slash = std::strchr(ipMask, '/');
    uint32_t address = 0;
    uint32_t mask = 0;
    if (slash == nullptr || !ParseIPv4(std::string(ipMask, slash), address) ||
        !ParseIPv4(slash + 1, mask)) {
        return -1;
    }
    const int length = PrefixLength(mask);
    if (length < 0) {
        return -1;
    }
    in_addr network;
    network.s_addr = htonl(address & mask);
    char text[INET_ADDRSTRLEN] = {};
    if (inet_ntop(AF_INET, &network, text, sizeof(text)) == nullptr) {
        return -1;
    }
    const int written = std::snprintf(out, static_cast<size_t>(size), "%s/%d", text, length);
    return written > 0 && written < size ? 0 : -1;
}

}  // extern "C"
