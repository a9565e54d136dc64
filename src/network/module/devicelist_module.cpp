#include "network/module/devicelist_module.h"

#include <exception>
#include <new>
#include <string>

#include "network/module/arpscanner.h"
#include "network/module/cvscanner.h"
#include "network/module/upnpscanner.h"
#include "network/module/wifiscanner.h"
#include "platform/qlibc_file.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr const char* kListDir = "/var/packages/Linkyard/target/data/";
constexpr const char* kListFile =
    "/var/packages/Linkyard/target/data//connectionlist_upnpscanner.json";
// Longer user texts are not names; they would only bloat the saved list.
constexpr std::size_t kMaxUserText = 256;

// A string member of the request; anything else is logged and refused.
bool ReadText(const Json::Value& request, const char* key, std::string& text) {
    if (!request.isObject() || !request.isMember(key) || !request[key].isString()) {
        VORN_LOG(LOG_ERR, "indata has no member (%s) or wrong format", key);
        return false;
    }
    text = request[key].asString();
    return true;
}

// A member of a scanner's client object as text; empty when absent or not a string.
std::string MemberText(const Json::Value& client, const char* key) {
    if (!client.isObject() || !client.isMember(key) || !client[key].isString()) {
        return std::string();
    }
    return client[key].asString();
}

struct MergeStep {
    int (DeviceListModule::*get)(Json::Value&);
    bool add;
    const char* getFailure;
    const char* mergeFailure;
};

// UPnP and CV lists only describe clients that ARP or wifi found. The wifi step's "cv" text is
// what the log has always said.
constexpr MergeStep kMergeSteps[] = {
    {&DeviceListModule::GetArpScannerData, true, "cannot get arp data",
     "cannot merge list from arp data"},
    {&DeviceListModule::GetUpnpScannerData, false, "cannot get upnp data",
     "cannot merge list from upnp data"},
    {&DeviceListModule::GetCVScannerData, false, "cannot get cv data",
     "cannot merge list from cv data"},
    {&DeviceListModule::GetWifiScannerData, true, "cannot get cv data",
     "cannot merge list from wifi data"},
};

}  // namespace

BaseModule* DeviceListModule::Create() {
    return new (std::nothrow) DeviceListModule();
}

int DeviceListModule::ProcessRequest(const Json::Value& request, Json::Value& answer) {
    try {
        std::string method;
        if (!ReadText(request, "method", method)) {
            return -1;
        }
        if (method == "get") {
            if (GetDataByScannerType(request, answer) != 0) {
                VORN_LOG(LOG_ERR, "failed to get data by scannertype");
                return -1;
            }
        } else if (method == "set") {
            if (SetData(request) != 0) {
                VORN_LOG(LOG_ERR, "failed to set data");
                return -1;
            }
        } else if (method == "del") {
            if (DeleteData(request) != 0) {
                VORN_LOG(LOG_ERR, "failed to del data");
                return -1;
            }
        } else {
            VORN_LOG(LOG_ERR, "unknown type from input (%s)", method.c_str());
            return -1;
        }
        return 0;
    } catch (const std::exception& error) {
        VORN_LOG(LOG_ERR, "Failed to process request: %s", error.what());
        return -1;
    }
}

int DeviceListModule::GetDataByScannerType(const Json::Value& request, Json::Value& answer) {
    std::string type;
    if (!ReadText(request, "scannertype", type)) {
        return -1;
    }
    if (type == "all") {
        if (GetAllScannerData(answer) != 0) {
            VORN_LOG(LOG_ERR, "failed to get all list data");
            return -1;
        }
        return 0;
    }
    int result = 0;
    if (type == "upnp") {
        result = GetUpnpScannerData(answer);
    } else if (type == "cv") {
        result = GetCVScannerData(answer);
    } else if (type == "wifi") {
        result = GetWifiScannerData(answer);
    } else {
        VORN_LOG(LOG_ERR, "unknown type from input (%s)", type.c_str());
        return -1;
    }
    if (result != 0) {
        VORN_LOG(LOG_ERR, "failed to get upnp data");
        return -1;
    }
    return 0;
}

int DeviceListModule::GetAllScannerData(Json::Value& answer) {
    for (const MergeStep& step : kMergeSteps) {
        Json::Value list(Json::objectValue);
        list["ClientList"] = Json::Value(Json::arrayValue);
        if ((this->*step.get)(list) != 0) {
            VORN_LOG(LOG_ERR, "%s", step.getFailure);
            return -1;
        }
        if (MergeList(list, step.add) != 0) {
            VORN_LOG(LOG_ERR, "%s", step.mergeFailure);
            return -1;
        }
    }
    if (!clients_.WriteToFile(kListFile)) {
        VORN_LOG(LOG_ERR, "failed to write back to (%s)", kListFile);
        return -1;
    }
    answer = clients_.GetClientList();
    return 0;
}

int DeviceListModule::MergeList(const Json::Value& list, const bool& add) {
    if (!list.isObject() || !list.isMember("ClientList") || !list["ClientList"].isArray()) {
        VORN_LOG(LOG_ERR, "wrong format of input list");
        return -1;
    }
    for (const Json::Value& client : list["ClientList"]) {
        const std::string mac = MemberText(client, "macAddr");
        const std::string ip = MemberText(client, "ipAddr");
        if (!mac.empty()) {
            clients_.UpdateKeysByMac(mac, client, add);
        } else if (!ip.empty()) {
            clients_.UpdateKeysByIP(ip, client, add);
        } else {
            VORN_LOG(LOG_ERR, "cannot get ip or mac from list object");
            return -1;
        }
    }
    return 0;
}

int DeviceListModule::SetData(const Json::Value& request) {
    std::string mac;
    std::string name;
    std::string type;
    if (!ReadText(request, "macAddr", mac) || !ReadText(request, "userdef_displayName", name) ||
        !ReadText(request, "userdef_deviceType", type)) {
        return -1;
    }
    if (mac.empty() || name.empty() || type.empty()) {
        VORN_LOG(LOG_ERR, "input string should not be empty");
        return -1;
    }
    if (name.size() > kMaxUserText || type.size() > kMaxUserText) {
        VORN_LOG(LOG_ERR, "input string too long");
        return -1;
    }
    Json::Value client;
    if (!clients_.GetObject(mac, client)) {
        VORN_LOG(LOG_ERR, "failed to get object (%s) from list", mac.c_str());
        return -1;
    }
    client["userdef_deviceType"] = type;
    client["userdef_displayName"] = name;
    clients_.UpdateKeysByMac(MemberText(client, "macAddr"), client, false);
    return 0;
}

int DeviceListModule::DeleteData(const Json::Value& request) {
    std::string mac;
    if (!ReadText(request, "macAddr", mac)) {
        return -1;
    }
    if (mac.empty()) {
        VORN_LOG(LOG_ERR, "input mac should not be empty");
        return -1;
    }
    if (!clients_.EraseObject(mac)) {
        VORN_LOG(LOG_ERR, "failed to erase object (%s) from list", mac.c_str());
        return -1;
    }
    return 0;
}

int DeviceListModule::GetArpScannerData(Json::Value& out) {
    if (arp_ == nullptr) {
        VORN_LOG(LOG_ERR, "no arp scanner when getting data");
        return -1;
    }
    out = arp_->GetData();
    return 0;
}

int DeviceListModule::GetUpnpScannerData(Json::Value& out) {
    if (upnp_ == nullptr) {
        VORN_LOG(LOG_ERR, "no upnp scanner when getting data");
        return -1;
    }
    out = upnp_->GetData();
    return 0;
}

int DeviceListModule::GetCVScannerData(Json::Value& out) {
    if (cv_ == nullptr) {
        VORN_LOG(LOG_ERR, "no cv scanner when getting data");
        return -1;
    }
    out = cv_->GetData();
    return 0;
}

int DeviceListModule::GetWifiScannerData(Json::Value& out) {
    if (wifi_ == nullptr) {
        VORN_LOG(LOG_ERR, "no wifi scanner when getting data");
        return -1;
    }
    out = wifi_->GetData();
    return 0;
}

int DeviceListModule::InitClientList() {
    if (QLIBCFileExist(kListFile) == 1 && !clients_.LoadClientList(kListFile)) {
        VORN_LOG(LOG_ERR, "failed to read (%s) to client list, skip it", kListFile);
        clients_.EraseList();
    }
    StartUpnpScanner();
    StartCVScanner();
    StartWifiScanner();
    StartArpScanner();
    return 0;
}

int DeviceListModule::TerminateClientList() {
    if (QLIBCFileCheckDir(kListDir, 0) == 1 && !clients_.WriteToFile(kListFile)) {
        VORN_LOG(LOG_ERR, "failed to write (%s) to client list when terminate", kListFile);
    }
    StopUpnpScanner();
    StopCVScanner();
    StopWifiScanner();
    StopArpScanner();
    return 0;
}

void DeviceListModule::StartUpnpScanner() {
    upnp_ = UpnpScanner::Inst();
    upnp_->Start();
}

void DeviceListModule::StartCVScanner() {
    cv_ = CVScanner::Inst();
    cv_->Start();
}

void DeviceListModule::StartWifiScanner() {
    wifi_ = WifiScanner::Inst();
    wifi_->Start();
}

void DeviceListModule::StartArpScanner() {
    arp_ = ArpScanner::Inst();
    arp_->Start();
}

void DeviceListModule::StopUpnpScanner() {
    if (upnp_ != nullptr) {
        upnp_->Stop();
    }
}

void DeviceListModule::StopCVScanner() {
    if (cv_ != nullptr) {
        cv_->Stop();
    }
}

void DeviceListModule::StopWifiScanner() {
    if (wifi_ != nullptr) {
        wifi_->Stop();
    }
}

void DeviceListModule::StopArpScanner() {
    if (arp_ != nullptr) {
        arp_->Stop();
    }
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
