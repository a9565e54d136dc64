// Section-file and key-file parsing: never reads out of bounds, and whatever it accepts, written
// back in the writers' formats, reads back as the same pairs.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <utility>
#include <vector>

#include "platform/qlibc_container.h"
#include "platform/text_file.h"
#include "require.h"

namespace {

using Pairs = std::vector<std::pair<std::string, std::string>>;
using namespace vorn::platform;

Pairs ToPairs(const QLIBSZHASH* hash) {
    Pairs pairs;
    for (int i = 0; i < QLIBCSzHashCount(hash); ++i) {
        pairs.emplace_back(QLIBCSzHashKeyAt(hash, i), QLIBCSzHashValueAt(hash, i));
    }
    return pairs;
}

std::string Write(const Pairs& pairs, const char* format) {
    std::string text;
    std::string line;
    for (const auto& pair : pairs) {
        Require(IsWritableKey(pair.first) && IsWritableValue(pair.second));
        Require(FormatPair(format, pair.first.c_str(), pair.second.c_str(), line));
        text += line;
    }
    return text;
}

void CheckSections(const std::string& text) {
    QLIBSZHASH* hash = QLIBCSzHashAlloc(16);
    QLIBSZHASH* again = QLIBCSzHashAlloc(16);
    for (const auto& name : SectionNames(text)) {
        Require(IsWritableSectionName(name));
        QLIBCHashRemoveAll(hash);
        QLIBCHashRemoveAll(again);
        Require(ReadSection(text, name, hash) == QLIBCSzHashCount(hash));
        const std::string written = "[" + name + "]\n" + Write(ToPairs(hash), "\t%s=%s\n");
        Require(SectionNames(written) == std::vector<std::string>{name});
        ReadSection(written, name, again);
        Require(ToPairs(again) == ToPairs(hash));
    }
    QLIBCSzHashFree(hash);
    QLIBCSzHashFree(again);
}

void CheckKeys(const std::string& text) {
    QLIBSZHASH* hash = QLIBCSzHashAlloc(16);
    QLIBSZHASH* again = QLIBCSzHashAlloc(16);
    Require(ReadKeys(text, "=", nullptr, hash) == QLIBCSzHashCount(hash));
    ReadKeys(Write(ToPairs(hash), "%s=\"%s\"\n"), "=", nullptr, again);
    Require(ToPairs(again) == ToPairs(hash));
    QLIBCSzHashFree(hash);
    QLIBCSzHashFree(again);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    if (!IsBoundedText(text)) {
        return 0;
    }
    CheckSections(text);
    CheckKeys(text);
    return 0;
}
