#include "utils/string_container.h"

#include <algorithm>
#include <iterator>
#include <memory>

#include "platform/qlibc_str.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

template <typename Output>
void ParseInto(const char* text, const char* delims, Output add) {
    if (text == nullptr || delims == nullptr) {
        return;
    }
    std::string copy(text);
    char* cursor = &copy[0];
    while (cursor != nullptr) {
        const char* piece = QLIBCStrTrimSpace(QLIBCStrSep(&cursor, delims));
        if (piece != nullptr && *piece != '\0') {
            add(piece);
        }
    }
}

// Clamps [start, start + count) to the container instead of reading past its end.
template <typename Container>
std::pair<typename Container::const_iterator, typename Container::const_iterator> Range(
    const Container& items, int start, int count) {
    const long long size = static_cast<long long>(items.size());
    const long long first = std::clamp<long long>(start, 0, size);
    const long long last = count < 0 ? size : std::min<long long>(first + count, size);
    return {std::next(items.begin(), first), std::next(items.begin(), last)};
}

template <typename Container>
std::string Join(const Container& items, const std::string& sep, int start, int count) {
    const auto range = Range(items, start, count);
    std::string joined;
    for (auto it = range.first; it != range.second; ++it) {
        if (it != range.first) {
            joined += sep;
        }
        joined += *it;
    }
    return joined;
}

template <typename Container>
Container FromList(const QLIBSZLIST* list) {
    Container items;
    const int count = list != nullptr ? QLIBCSzListCount(list) : 0;
    for (int i = 0; i < count; ++i) {
        if (const char* value = QLIBCSzListGet(list, i)) {
            items.insert(items.end(), value);
        }
    }
    return items;
}

template <typename Container>
int ToList(const Container& items, QLIBSZLIST** list) {
    if (list == nullptr) {
        return -1;
    }
    if (*list == nullptr) {
        *list = QLIBCSzListAlloc(static_cast<int>(items.size()));
        if (*list == nullptr) {
            return -1;
        }
    }
    for (const auto& item : items) {
        if (QLIBCSzListAdd(*list, item.c_str()) != 0) {
            return -1;
        }
    }
    return 0;
}

template <typename Container>
Container FromJson(const Json::Value& array) {
    Container items;
    if (!array.isArray()) {
        return items;
    }
    for (const auto& element : array) {
        if (element.isString()) {
            items.insert(items.end(), element.asString());
        }
    }
    return items;
}

template <typename Container>
Json::Value ToJson(const Container& items) {
    Json::Value array(Json::arrayValue);
    for (const auto& item : items) {
        array.append(item);
    }
    return array;
}

bool Contains(const StringSet& items, const std::string& item) {
    return items.count(item) != 0;
}

bool Contains(const StringVector& items, const std::string& item) {
    return std::find(items.begin(), items.end(), item) != items.end();
}

template <typename Container>
Container Select(const Container& a, const Container& b, bool wantInB) {
    Container selected;
    for (const auto& item : a) {
        if (Contains(b, item) == wantInB) {
            selected.insert(selected.end(), item);
        }
    }
    return selected;
}

template <typename Container>
void PrintElements(const Container& items) {
    for (const auto& item : items) {
        VORN_LOG(LOG_DEBUG, "%s", item.c_str());
    }
}

}  // namespace

StringVector ParseToVector(const char* text, const char* delims) {
    StringVector items;
    ParseInto(text, delims, [&items](const char* piece) { items.emplace_back(piece); });
    return items;
}

StringSet ParseToSet(const char* text, const char* delims) {
    StringSet items;
    ParseInto(text, delims, [&items](const char* piece) { items.emplace(piece); });
    return items;
}

Json::Value ParseToJsonArray(const char* text, const char* delims) {
    Json::Value array(Json::arrayValue);
    ParseInto(text, delims, [&array](const char* piece) { array.append(piece); });
    return array;
}

std::string ConvertToString(const StringVector& items, const std::string& sep, int start,
                            int count) {
    return Join(items, sep, start, count);
}

std::string ConvertToString(const StringSet& items, const std::string& sep, int start, int count) {
    return Join(items, sep, start, count);
}

std::string ConvertToString(const Json::Value& array, const std::string& sep, int start,
                            int count) {
    StringVector texts;
    if (array.isArray()) {
        for (const auto& element : array) {
            texts.push_back(element.isString() ? element.asString() : ConvertToString(element));
        }
    }
    return Join(texts, sep, start, count);
}

std::string ConvertToString(const Json::Value& value) {
    Json::StreamWriterBuilder builder;
    builder["indentation"] = "";
    builder["commentStyle"] = "None";
    return Json::writeString(builder, value);
}

StringVector GetElementInRange(const StringVector& items, int start, int count) {
    const auto range = Range(items, start, count);
    return StringVector(range.first, range.second);
}

StringVector::const_iterator Find(const std::string& item, const StringVector& items) {
    return std::find(items.begin(), items.end(), item);
}

bool IsExist(const std::string& item, const StringVector& items) {
    return Contains(items, item);
}

void Remove(const std::string& item, StringVector& items) {
    const auto found = Find(item, items);
    if (found != items.end()) {
        items.erase(found);
    }
}

StringSet ConvertToSet(const StringVector& items) {
    return StringSet(items.begin(), items.end());
}

StringVector ConvertToVector(const StringSet& items) {
    return StringVector(items.begin(), items.end());
}

StringSet ConvertToSet(const QLIBSZLIST* list) {
    return FromList<StringSet>(list);
}

StringVector ConvertToVector(const QLIBSZLIST* list) {
    return FromList<StringVector>(list);
}

Json::Value ConvertToJsonArray(const QLIBSZLIST* list) {
    return ToJson(ConvertToVector(list));
}

int ConvertToQLIBList(const StringSet& items, QLIBSZLIST** list) {
    return ToList(items, list);
}

int ConvertToQLIBList(const StringVector& items, QLIBSZLIST** list) {
    return ToList(items, list);
}

StringSet ConvertToSet(const Json::Value& array) {
    return FromJson<StringSet>(array);
}

StringVector ConvertToVector(const Json::Value& array) {
    return FromJson<StringVector>(array);
}

Json::Value ConvertToJsonArray(const StringSet& items) {
    return ToJson(items);
}

Json::Value ConvertToJsonArray(const StringVector& items) {
    return ToJson(items);
}

StringSet GetDiff(const StringSet& a, const StringSet& b) {
    return Select(a, b, false);
}

StringVector GetDiff(const StringVector& a, const StringVector& b) {
    return Select(a, b, false);
}

StringSet GetIntersection(const StringSet& a, const StringSet& b) {
    return Select(a, b, true);
}

StringVector GetIntersection(const StringVector& a, const StringVector& b) {
    return Select(a, b, true);
}

void GetUniqueStrVector(StringVector& items) {
    StringSet seen;
    items.erase(
        std::remove_if(items.begin(), items.end(),
                       [&seen](const std::string& item) { return !seen.insert(item).second; }),
        items.end());
}

void Print(const StringSet& items) {
    PrintElements(items);
}

void Print(const StringVector& items) {
    PrintElements(items);
}

void Print(const Json::Value& value) {
    VORN_LOG(LOG_DEBUG, "%s", ConvertToString(value).c_str());
}

}  // namespace utils
}  // namespace vornwireless
