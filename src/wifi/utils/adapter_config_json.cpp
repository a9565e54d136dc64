#include "wifi/utils/adapter_config_json.h"

#include <type_traits>

#include "utils/log.h"
#include "wifi/settings/adapter_config_check.h"
#include "wifi/settings/field_text.h"

namespace vornwireless {
namespace wifi {
namespace utils {
namespace {

struct ToJson {
    Json::Value& object;

    void operator()(const char* key, bool value) { object[key] = value; }
    void operator()(const char* key, int value) { object[key] = value; }
    template <typename T>
    void operator()(const char* key, const T& value) {
        object[key] = ToText(value);
    }
    template <typename Text>
    void operator()(const char* key, const Secret<Text>& secret) {
        object[key] = secret.text;
    }
};

class FromJson {
  public:
    explicit FromJson(const Json::Value& object) : object_(object) {}

    void operator()(const char* key, bool& value) {
        const Json::Value& member = Member(key);
        if (member.isBool()) {
            value = member.asBool();
        } else {
            Refuse(key);
        }
    }
    void operator()(const char* key, int& value) {
        const Json::Value& member = Member(key);
        if (member.isInt()) {
            value = member.asInt();
        } else {
            Refuse(key);
        }
    }
    template <typename T>
    void operator()(const char* key, T& value) {
        const Json::Value& member = Member(key);
        if (!member.isString() || !FromText(member.asString(), value)) {
            Refuse(key);
        }
    }
    template <typename Text>
    void operator()(const char* key, const Secret<Text>& secret) {
        (*this)(key, secret.text);
    }

    const Json::Value& Member(const char* key) const {
        static const Json::Value absent;
        return object_.isObject() && object_.isMember(key) ? object_[key] : absent;
    }
    bool Ok() const { return ok_; }

  private:
    void Refuse(const char* key) {
        if (ok_) {
            VORN_LOG(LOG_ERR, "Bad value of key [%s] in config", key);
            ok_ = false;
        }
    }

    const Json::Value& object_;
    bool ok_ = true;
};

template <typename Record, typename VisitFields>
Json::Value ArrayToJson(const std::vector<Record>& records, VisitFields visitFields) {
    Json::Value array(Json::arrayValue);
    for (const auto& record : records) {
        Json::Value object(Json::objectValue);
        visitFields(record, ToJson{object});
        array.append(object);
    }
    return array;
}

template <typename Record, typename VisitFields>
bool ArrayFromJson(const Json::Value& array, std::vector<Record>& records,
                   VisitFields visitFields) {
    if (!array.isArray()) {
        return false;
    }
    for (const auto& object : array) {
        Record record;
        FromJson read(object);
        visitFields(record, read);
        if (!read.Ok()) {
            return false;
        }
        records.push_back(record);
    }
    return true;
}

const auto kVisitRule = [](auto& rule, auto&& visit) { VisitMacFilterRuleFields(rule, visit); };
const auto kVisitStation = [](auto& station, auto&& visit) { VisitStationFields(station, visit); };

}  // namespace

Json::Value GetJsonValue(const AdapterConfig& config) {
    Json::Value json(Json::objectValue);
    json["name"] = config.name;
    VisitAccessPointFields(config, ToJson{json});
    json["mac_filter_rules"] = ArrayToJson(config.mac_filter_rules, kVisitRule);
    json["clientenabled"] = config.client_enabled;
    json["stations"] = ArrayToJson(config.stations, kVisitStation);
    return json;
}

int GetConfig(const Json::Value& json, AdapterConfig& config) {
    AdapterConfig built;
    FromJson read(json);
    read("name", built.name);
    VisitAccessPointFields(built, read);
    read("clientenabled", built.client_enabled);
    if (!read.Ok()) {
        return -1;
    }
    if (!ArrayFromJson(read.Member("mac_filter_rules"), built.mac_filter_rules, kVisitRule) ||
        !ArrayFromJson(read.Member("stations"), built.stations, kVisitStation)) {
        VORN_LOG(LOG_ERR, "Bad list in config");
        return -1;
    }
    if (CheckAdapterConfig(built) != 0) {
        return -1;
    }
    config = built;
    return 0;
}

int ConnectionJsonToStationInfo(const Json::Value& json, AdapterConfig::StationInfo& station) {
    std::vector<AdapterConfig::StationInfo> read;
    Json::Value one(Json::arrayValue);
    one.append(json);
    if (!ArrayFromJson(one, read, kVisitStation) || CheckStationInfo(read.front()) != 0) {
        VORN_LOG(LOG_ERR, "Bad station in connection");
        return -1;
    }
    station = read.front();
    return 0;
}

}  // namespace utils
}  // namespace wifi
}  // namespace vornwireless
