#include "wifi/settings/adapter_config.h"

#include <type_traits>

#include "wifi/settings/field_text.h"

namespace vornwireless {
namespace wifi {
namespace {

// The fields as texts, enumerations by number so that two unnamed values still differ.
struct Collect {
    std::vector<std::string>& texts;

    template <typename T>
    void operator()(const char*, const T& value) {
        if constexpr (std::is_enum<T>::value) {
            texts.push_back(std::to_string(static_cast<int>(value)));
        } else {
            texts.push_back(ToText(value));
        }
    }
    template <typename Text>
    void operator()(const char* key, const Secret<Text>& secret) {
        (*this)(key, secret.text);
    }
};

template <typename Record, typename VisitFields>
std::vector<std::string> Texts(const Record& record, VisitFields visitFields) {
    std::vector<std::string> texts;
    visitFields(record, Collect{texts});
    return texts;
}

}  // namespace

bool AdapterConfig::MacFilterRule::operator==(const MacFilterRule& other) const {
    return enable == other.enable && mac == other.mac && desc == other.desc;
}

bool AdapterConfig::StationInfo::operator==(const StationInfo& other) const {
    const auto visit = [](const StationInfo& s, Collect c) { VisitStationFields(s, c); };
    return signal == other.signal && Texts(*this, visit) == Texts(other, visit);
}

bool AdapterConfig::operator==(const AdapterConfig& other) const {
    const auto visit = [](const AdapterConfig& c, Collect collect) {
        VisitAccessPointFields(c, collect);
    };
    return name == other.name && mac_filter_rules == other.mac_filter_rules &&
           client_enabled == other.client_enabled && stations == other.stations &&
           Texts(*this, visit) == Texts(other, visit);
}

}  // namespace wifi
}  // namespace vornwireless
