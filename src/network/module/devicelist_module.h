#ifndef VORN_NETWORK_MODULE_DEVICELIST_MODULE_H
#define VORN_NETWORK_MODULE_DEVICELIST_MODULE_H

#include <json/json.h>

#include "network/module/base_module.h"
#include "network/module/clientlist.h"

namespace vornnetwork {
namespace network {
namespace module {

class ArpScanner;
class CVScanner;
class UpnpScanner;
class WifiScanner;

// The clients of the local network, merged from what the four scanners found into one list that
// survives restarts. ARP and wifi lists add clients; UPnP and CV lists only describe clients
// already known. The user may name a client and give its kind ("set") or drop it ("del").
//
// Requests come from the D-Bus thread one at a time and are untrusted: a missing or mistyped
// key is logged and the request refused with -1, leaving the list as it was.
class DeviceListModule : public BaseModule {
  public:
    DeviceListModule() : BaseModule(MODULE_DEVICE_LIST) {}

    int ProcessRequest(const Json::Value& request, Json::Value& answer) override;
    int InitialModule() override { return InitClientList(); }
    int TerminateModule() override { return TerminateClientList(); }
    int StartModule() override { return 0; }

    static BaseModule* Create();

    int GetDataByScannerType(const Json::Value& request, Json::Value& answer);
    int SetData(const Json::Value& request);
    int DeleteData(const Json::Value& request);
    // Merges the scanners' lists in a fixed order (ARP, UPnP, CV, wifi), saves the result and
    // answers with it.
    int GetAllScannerData(Json::Value& answer);
    int MergeList(const Json::Value& list, const bool& add);

    // Each scanner's current list; virtual so that tests and benchmarks can give lists of their
    // own without live scans.
    virtual int GetArpScannerData(Json::Value& out);
    virtual int GetUpnpScannerData(Json::Value& out);
    virtual int GetCVScannerData(Json::Value& out);
    virtual int GetWifiScannerData(Json::Value& out);

    int InitClientList();
    int TerminateClientList();
    void StartUpnpScanner();
    void StartCVScanner();
    void StartWifiScanner();
    void StartArpScanner();
    void StopUpnpScanner();
    void StopCVScanner();
    void StopWifiScanner();
    void StopArpScanner();

  private:
    UpnpScanner* upnp_ = nullptr;
    CVScanner* cv_ = nullptr;
    WifiScanner* wifi_ = nullptr;
    ArpScanner* arp_ = nullptr;
    ClientList clients_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
