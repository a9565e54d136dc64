#ifndef VORN_NETWORK_MODULE_ROUTE_MODULE_H
#define VORN_NETWORK_MODULE_ROUTE_MODULE_H

#include <json/json.h>

#include <string>
#include <vector>

#include "network/module/base_module.h"
#include "utils/ip_address.h"

namespace vornnetwork {
namespace network {
namespace module {

// Request texts "GTYPE_V4" and "GTYPE_V6".
enum GATEWAY_TYPE { GTYPE_V4 = 0, GTYPE_V6 = 1 };

// One candidate default gateway: the interface it goes out of and what was learnt with it.
struct GatewayInfo {
    std::string ifname;
    std::string class_ = "unknown";  // "ethernet" entries are skipped while their cable is out
    vornwireless::utils::IPAddress gateway;
    vornwireless::utils::IPAddress dns;
    bool slave = false;  // enslaved interfaces are never chosen
};

// Keeps the IPv4 and IPv6 lists of candidate default gateways in priority order (index 0 first),
// saves every change to the priority, database and resolver files under
// "/etc/iproute2/config/", and installs the default route through the first usable entry.
//
// Requests come from the D-Bus thread and from the IPv6 module's thread: each one runs under the
// module's own mutex. Requests are untrusted: a request with a missing or mistyped key is logged
// and refused before anything changes.
class RouteModule : public BaseModule {
  public:
    using GatewayList = std::vector<GatewayInfo>;

    RouteModule();

    // Always 0: an operation's failure shows only in the log.
    int ProcessRequest(const Json::Value& request, Json::Value& answer) override;
    int InitialModule() override;
    int TerminateModule() override { return 0; }
    int StartModule() override { return 0; }

    static BaseModule* Create();

    int ReadGatewayListFromFile(GATEWAY_TYPE type);
    int WriteGatewayListToFile(GATEWAY_TYPE type);
    int WriteGatewayToDatabase(GATEWAY_TYPE type);
    int WriteDnsFile(GATEWAY_TYPE type);

    int AddGatewayInfo(const Json::Value& request);
    int DelGatewayInfo(const Json::Value& request);
    int SetSlaveForGatewayInfo(const Json::Value& request);
    int CopyGatewayData(const Json::Value& request);
    int GetGatewayListData(const Json::Value& request, Json::Value& answer);
    int GetGatewayDataByInterface(const Json::Value& request, Json::Value& answer);

    int RefreshDefaultGateway(const Json::Value& request);
    int RefreshDefaultGatewayV4();
    int RefreshDefaultGatewayV6();

    // A copy of one list; empty for an unknown type.
    GatewayList GetList(GATEWAY_TYPE type) const;

  private:
    void Dispatch(const std::string& method, const Json::Value& request, Json::Value& answer);
    // Whether an add would grow a list already at its bound.
    bool IsNewEntryBeyondLimit(const std::string& method, const Json::Value& request);
    // Runs an operation and, when the request asks for it, a refresh after it.
    void RunAndRefresh(int (RouteModule::*operation)(const Json::Value&),
                       const Json::Value& request);
    GatewayList* SelectList(GATEWAY_TYPE type);
    // The list named by the request's "type"; null, after logging unknownText, when there is none.
    GatewayList* SelectList(const Json::Value& request, const char* unknownText);
    // The index of the interface's entry, or the list's size.
    static std::size_t Find(const GatewayList& list, const std::string& ifname);
    // Installs the default route through the first usable entry, which then moves to the front.
    bool InstallFirstUsable(GatewayList& list, bool ipv6);

    GatewayList gateways_v4_;
    GatewayList gateways_v6_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
