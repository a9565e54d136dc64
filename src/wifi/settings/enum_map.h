#ifndef VORN_WIFI_SETTINGS_ENUM_MAP_H
#define VORN_WIFI_SETTINGS_ENUM_MAP_H

#include <map>
#include <string>

#include "wifi/settings/enum.h"

namespace vornwireless {
namespace wifi {

// Logs an unknown key as the original header did, with its path and line: the line is part of
// the log vocabulary.
void LogEnumKeyNotFound(const std::string& key);

// Conversions between an enumeration and its strings. The table is built on first use and never
// freed; first uses must not race (the wifi daemon runs one thread).
template <typename E>
class EnumMap {
  public:
    using Table = std::map<std::string, E>;

    // The first string in byte-wise order that maps to value, so an aliased value yields its
    // smallest alias (WIFI_OPMODE_MANAGED gives "Any"); "error" when none does.
    static std::string EnumToString(E value) {
        for (const auto& row : GetTable()) {
            if (row.second == value) {
                return row.first;
            }
        }
        return "error";
    }

    // Exact, case-sensitive lookup; an unknown key logs and yields the "error" value.
    static E StringToEnum(const std::string& key) {
        const Table& table = GetTable();
        const auto found = table.find(key);
        if (found != table.end()) {
            return found->second;
        }
        LogEnumKeyNotFound(key);
        return table.find("error")->second;
    }

    // Whether key is one of the table's strings; unlike StringToEnum it does not log.
    static bool IsKnown(const std::string& key) { return GetTable().count(key) != 0; }

    static const Table& GetTable() {
        static Table table;
        static bool built = false;
        if (!built) {
            built = CreateMap(table);
        }
        return table;
    }
};

}  // namespace wifi
}  // namespace vornwireless

#endif
