// The scan listing of "iwlist IF scanning vorn" (security words included): every network it
// accepts has the documented ranges, and once given a passphrase its JSON form reads back as the
// same network unless its name holds a byte no settings file may carry.
#include <json/json.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <sstream>
#include <string>
#include <vector>

#include "require.h"
#include "utils/log.h"
#include "wifi/adapter/adapter_agent_client_base.h"
#include "wifi/utils/adapter_config_json.h"
#include "wifi/utils/station_utils.h"

namespace {

using vornwireless::wifi::AdapterAgentClientBase;
using StationInfo = vornwireless::wifi::AdapterConfig::StationInfo;

bool HasLineByte(const std::string& text) {
    return text.find_first_of(std::string("\r\n\0", 3)) != std::string::npos;
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    vorn::log::SetSink([](int, const std::string&) {});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    std::istringstream in(std::string(reinterpret_cast<const char*>(data), size));
    std::vector<std::string> lines;
    for (std::string line; std::getline(in, line);) {
        lines.push_back(line);
    }
    for (const StationInfo& station : AdapterAgentClientBase::ParseScanList(lines)) {
        Require(station.bssid.IsFormalized() && !station.essid.empty() &&
                station.essid.size() <= 32 && station.channel >= 0 && station.channel <= 200 &&
                station.signal >= 0 && station.signal <= 100);
        // Stored as a user would: with the passphrase a scan does not carry.
        StationInfo stored = station;
        stored.password = "passphrase";
        StationInfo back;
        const int read = vornwireless::wifi::utils::ConnectionJsonToStationInfo(
            vornwireless::wifi::utils::StationInfoToJson(stored), back);
        Require(read == 0 || HasLineByte(station.essid));
        back.signal = stored.signal;  // a scan's own figure, not part of the stored form
        Require(read != 0 || back == stored);
    }
    return 0;
}
