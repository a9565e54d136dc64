#include "utils/json_text.h"

#include <exception>
#include <memory>

namespace vornwireless {
namespace utils {

bool ParseJson(const std::string& text, Json::Value& value, std::size_t maxLength) {
    if (text.size() > maxLength) {
        return false;
    }
    Json::CharReaderBuilder builder;
    builder["collectComments"] = true;
    builder["allowComments"] = true;
    builder["stackLimit"] = kMaxJsonDepth;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    Json::Value parsed;
    try {
        if (!reader->parse(text.data(), text.data() + text.size(), &parsed, nullptr)) {
            return false;
        }
    } catch (const std::exception&) {
        return false;  // the depth limit throws
    }
    value.swap(parsed);
    return true;
}

std::string StyledJson(const Json::Value& value) {
    return value.toStyledString();
}

std::string CompactJson(const Json::Value& value) {
    Json::StreamWriterBuilder builder;
    builder["indentation"] = "";
    return Json::writeString(builder, value);
}

}  // namespace utils
}  // namespace vornwireless
