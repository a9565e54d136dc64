#include "platform/qlibc_str.h"

#include <cctype>
#include <cstring>

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

}  // extern "C"
