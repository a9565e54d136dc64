// The output of the programs the daemons read (arp, the DHCP lease file, iw, hostapd_cli,
// wpa_cli, iwconfig, the host discovery's list, UPnP descriptions): the first byte picks the
// parser. Whatever a parser accepts has the form its callers rely on.
#include <arpa/inet.h>
#include <json/json.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "network/module/arpscanner.h"
#include "network/module/cvscanner.h"
#include "network/module/upnpscanner.h"
#include "network/module/wifiscanner.h"
#include "platform/root_path.h"
#include "platform/text_file.h"
#include "require.h"
#include "scratch_world.h"
#include "utils/interface_name.h"
#include "utils/log.h"
#include "utils/mac_address.h"
#include "wifi/adapter/adapter_agent_hostapd.h"
#include "wifi/utils/station_utils.h"
#include "wifi/utils/utils.h"

namespace {

using namespace vornnetwork::network::module;
using vornwireless::utils::MacAddress;
using vornwireless::wifi::AdapterAgentHostapd;
namespace wifi = vornwireless::wifi::utils;

constexpr const char* kLeaseMac = "00:11:32:0a:bc:de";

std::vector<std::string> Lines(const std::string& text) {
    std::istringstream in(text);
    std::vector<std::string> lines;
    for (std::string line; std::getline(in, line);) {
        lines.push_back(line);
    }
    return lines;
}

bool IsWord(const std::string& text) {
    return text.find_first_of(" \t\n\v\f\r") == std::string::npos;
}

bool IsIPv4(const std::string& text) {
    in_addr address;
    char back[INET_ADDRSTRLEN] = "";
    return inet_pton(AF_INET, text.c_str(), &address) == 1 &&
           inet_ntop(AF_INET, &address, back, sizeof back) != nullptr && text == back;
}

bool IsColonMac(const std::string& text) {
    return MacAddress::IsFormalized(text) && MacAddress(text).ToString() == text;
}

void CheckArpLine(const std::string& text) {
    ArpScanner::ArpEntry entry;
    if (ArpScanner::ParseArpLine(text, entry) == 1) {
        Require(IsIPv4(entry.ip) && IsColonMac(entry.mac) && IsWord(entry.name) &&
                vornwireless::utils::IsValidInterfaceName(entry.ifname) &&
                entry.ifname.find("br") != std::string::npos);
    }
}

void CheckLeases(const std::string& text) {
    std::string name;
    ArpScanner::FindLeaseName(vorn::platform::SplitLines(text), kLeaseMac, name);
    Require(IsWord(name) && name != "*");
}

void CheckIwStation(const std::string& text) {
    Json::Value station(Json::objectValue);
    WifiScanner::ParseIwStation(Lines(text), station);
    for (const char* counter : {"transferRX", "transferTX"}) {
        Require(!station.isMember(counter) || IsWord(station[counter].asString()));
    }
    const int signal = station.get("signalstrength", 0).asInt();
    Require(signal >= 0 && signal <= 100);
}

void CheckAllSta(const std::string& text) {
    for (const std::string& mac : WifiScanner::ParseStations(Lines(text))) {
        Require(mac.size() == 17 && MacAddress::IsFormalized(mac));
    }
    for (const auto& station : AdapterAgentHostapd::ParseStations(Lines(text))) {
        Require(station.mac.IsFormalized());
    }
}

void CheckSupplicantStatus(const std::string& text) {
    std::map<std::string, std::string> status;
    wifi::ParseSupplicantStatus(Lines(text), status);
    for (const auto& pair : status) {
        Require(!pair.first.empty() && pair.first.find('=') == std::string::npos);
    }
}

void CheckPhyInfo(const std::string& text) {
    Require(wifi::ParseBandLetters(Lines(text)).find_first_not_of("abgn") == std::string::npos);
    // SetTXPower scales this into an int.
    const double power = AdapterAgentHostapd::ParseMaxPower(text);
    Require(power >= 0 && power <= 100);
}

void CheckLinkQuality(const std::string& text) {
    const int quality = wifi::ParseLinkQuality(text);
    Require(quality >= -1 && quality <= 100);
}

void CheckCVList(const std::string& text) {
    std::ofstream(vorn::platform::RootPath("/tmp/linkyard_cvscanner_list.tmp"), std::ios::binary)
        << text;
    CVScanner& scanner = *CVScanner::Inst();
    scanner.ReadFHOSTListFile();
    const Json::Value list = scanner.GetClientList()["ClientList"];
    scanner.EraseList();
    Require(list.size() <= 1024);
    for (const Json::Value& host : list) {
        Require(IsIPv4(host["ipAddr"].asString()) && IsColonMac(host["macAddr"].asString()) &&
                std::strtol(host["modelName"].asCString(), nullptr, 10) >= 240);
    }
}

void CheckDescription(const std::string& text) {
    Json::Value device;
    if (!UpnpScanner::DescribeDevice(text, device)) {
        return;
    }
    for (const char* tag :
         {"deviceType", "modelName", "modelDescription", "friendlyName", "manufacturer"}) {
        const std::string name = device[tag].asString();
        Require(name.size() <= 256 &&
                (name.empty() || (name.front() != ' ' && name.back() != ' ')));
        for (const char c : name) {
            Require(static_cast<unsigned char>(c) >= 0x20 && c != 0x7f);
        }
    }
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    EnterScratchWorld({"/tmp"});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    using Check = void (*)(const std::string&);
    static const Check checks[] = {CheckArpLine,          CheckLeases,  CheckIwStation,
                                   CheckAllSta,           CheckPhyInfo, CheckLinkQuality,
                                   CheckSupplicantStatus, CheckCVList,  CheckDescription};
    if (size == 0) {
        return 0;
    }
    const std::string text(reinterpret_cast<const char*>(data) + 1, size - 1);
    checks[data[0] % (sizeof checks / sizeof checks[0])](text);
    return 0;
}
