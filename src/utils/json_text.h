#ifndef VORN_UTILS_JSON_TEXT_H
#define VORN_UTILS_JSON_TEXT_H

#include <json/json.h>

#include <cstddef>
#include <string>

namespace vornwireless {
namespace utils {

// Requests are small; anything larger or deeper is refused rather than parsed.
constexpr std::size_t kMaxJsonTextLength = 64 * 1024;
// Replies of our own daemons can be large: a device list of a few thousand clients runs to a few
// megabytes of styled text.
constexpr std::size_t kMaxJsonReplyLength = 16 * 1024 * 1024;
constexpr int kMaxJsonDepth = 64;

// Parses JSON text (comments allowed and collected) into value. False, with value unchanged, for
// text that is malformed, longer than maxLength or nested deeper than kMaxJsonDepth.
bool ParseJson(const std::string& text, Json::Value& value,
               std::size_t maxLength = kMaxJsonTextLength);

// The styled (indented, multi-line) text of a value, as the services send it.
std::string StyledJson(const Json::Value& value);
// One line, no trailing line end.
std::string CompactJson(const Json::Value& value);

}  // namespace utils
}  // namespace vornwireless

#endif
