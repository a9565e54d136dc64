#include "utils/json_text.h"

#include <exception>
#include <memory>
#include <sstream>

namespace vornwireless {
namespace utils {
namespace {

// Making a reader or writer from its settings costs more than reading or writing a request, so
// each thread keeps its own (they hold state while they work and may not be shared).
Json::CharReader& Reader() {
    thread_local const std::unique_ptr<Json::CharReader> reader = [] {
        Json::CharReaderBuilder builder;
        builder["collectComments"] = true;
        builder["allowComments"] = true;
        builder["stackLimit"] = kMaxJsonDepth;
        return std::unique_ptr<Json::CharReader>(builder.newCharReader());
    }();
    return *reader;
}

std::unique_ptr<Json::StreamWriter> NewWriter(const char* indentation) {
    Json::StreamWriterBuilder builder;
    builder["indentation"] = indentation;
    return std::unique_ptr<Json::StreamWriter>(builder.newStreamWriter());
}

std::string Write(Json::StreamWriter& writer, const Json::Value& value) {
    std::ostringstream text;
    writer.write(value, &text);
    return text.str();
}

}  // namespace

bool ParseJson(const std::string& text, Json::Value& value, std::size_t maxLength) {
    if (text.size() > maxLength) {
        return false;
    }
    Json::Value parsed;
    try {
        if (!Reader().parse(text.data(), text.data() + text.size(), &parsed, nullptr)) {
            return false;
        }
    } catch (const std::exception&) {
        return false;  // the depth limit throws
    }
    value.swap(parsed);
    return true;
}

// The bytes of Json::Value::toStyledString.
std::string StyledJson(const Json::Value& value) {
    thread_local const std::unique_ptr<Json::StreamWriter> writer = NewWriter("\t");
    std::string text = value.hasComment(Json::commentBefore) ? "\n" : "";
    text += Write(*writer, value);
    text += '\n';
    return text;
}

std::string CompactJson(const Json::Value& value) {
    thread_local const std::unique_ptr<Json::StreamWriter> writer = NewWriter("");
    return Write(*writer, value);
}

}  // namespace utils
}  // namespace vornwireless
