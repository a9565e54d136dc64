#ifndef VORN_UTILS_STRING_CONTAINER_H
#define VORN_UTILS_STRING_CONTAINER_H

#include <json/json.h>

#include <set>
#include <string>
#include <vector>

#include "platform/qlibc_container.h"

namespace vornwireless {
namespace utils {

using StringVector = std::vector<std::string>;
using StringSet = std::set<std::string>;

// Splits text on any of delims, trims each piece and drops the empty ones. Null arguments give
// an empty result.
StringVector ParseToVector(const char* text, const char* delims);
StringSet ParseToSet(const char* text, const char* delims);
Json::Value ParseToJsonArray(const char* text, const char* delims);

// Joins count elements from start (count -1: to the end) with sep between them. A range past
// the end stops at the end.
std::string ConvertToString(const StringVector& items, const std::string& sep, int start = 0,
                            int count = -1);
std::string ConvertToString(const StringSet& items, const std::string& sep, int start = 0,
                            int count = -1);
// The same over a JSON array; strings join as they are, other elements in compact JSON.
std::string ConvertToString(const Json::Value& array, const std::string& sep, int start = 0,
                            int count = -1);
// Compact JSON text without a line end, as Json::FastWriter prints it less its final newline.
std::string ConvertToString(const Json::Value& value);

// The elements from start; a negative count takes the rest, a larger one stops at the end.
StringVector GetElementInRange(const StringVector& items, int start, int count);

StringVector::const_iterator Find(const std::string& item, const StringVector& items);
bool IsExist(const std::string& item, const StringVector& items);
// Erases the first element equal to item.
void Remove(const std::string& item, StringVector& items);

StringSet ConvertToSet(const StringVector& items);
// In sorted order.
StringVector ConvertToVector(const StringSet& items);

// Platform string lists; a null list reads as empty.
StringSet ConvertToSet(const QLIBSZLIST* list);
StringVector ConvertToVector(const QLIBSZLIST* list);
Json::Value ConvertToJsonArray(const QLIBSZLIST* list);
// Appends the items to *list, allocating it when null. 0, or -1 for a null list pointer or no
// memory.
int ConvertToQLIBList(const StringSet& items, QLIBSZLIST** list);
int ConvertToQLIBList(const StringVector& items, QLIBSZLIST** list);

// JSON string arrays; elements that are not strings are skipped, a non-array reads as empty.
StringSet ConvertToSet(const Json::Value& array);
StringVector ConvertToVector(const Json::Value& array);
Json::Value ConvertToJsonArray(const StringSet& items);
Json::Value ConvertToJsonArray(const StringVector& items);

// The elements of a that are not in b (in the order of a).
StringSet GetDiff(const StringSet& a, const StringSet& b);
StringVector GetDiff(const StringVector& a, const StringVector& b);
// The elements of a that are also in b (in the order of a).
StringSet GetIntersection(const StringSet& a, const StringSet& b);
StringVector GetIntersection(const StringVector& a, const StringVector& b);

// Removes later copies of an element, keeping the order of the first ones.
void GetUniqueStrVector(StringVector& items);

// Debug log lines: one per element, or the compact JSON text.
void Print(const StringSet& items);
void Print(const StringVector& items);
void Print(const Json::Value& value);

}  // namespace utils
}  // namespace vornwireless

#endif
