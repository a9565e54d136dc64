#ifndef VORN_NETWORK_MODULE_ARPSCANNER_H
#define VORN_NETWORK_MODULE_ARPSCANNER_H

#include <pthread.h>

#include <atomic>
#include <string>
#include <vector>

#include "network/module/clientlist.h"

namespace vornnetwork {
namespace network {
namespace module {

// Clients of the local bridges from the kernel's ARP table, named from the DHCP server's leases
// or by NetBIOS. A scan runs on a detached thread, one at a time.
class ArpScanner : public ClientList {
  public:
    static ArpScanner* Inst();

    // Starts a scan when none runs and answers with the last finished one (empty before the
    // first has finished).
    Json::Value GetData();
    int Start() { return 0; }
    int Stop() { return 0; }
    // Whether a scan thread is still at work.
    static bool IsScanning() { return scanning_; }

    // A client as one line of "arp -a" names it.
    struct ArpEntry {
        std::string name;
        std::string ip;
        std::string mac;
        std::string ifname;
    };

    void UpdateArpTabe();
    int GetArpTable();
    // One line of "arp -a": "host (ip) at mac [ether] on ifname".
    int AppendClientList(const std::string& line);
    // 1 for a client of a bridge (IPv4, colon MAC and interface name checked), 0 for a line of
    // another interface, -1 (logged) for a bridge line with a bad address or interface.
    static int ParseArpLine(const std::string& line, ArpEntry& entry);
    int GetDHCPInfoByMAC(const std::string& mac, std::string& name);
    // The host name of the first lease line holding mac ("expiry mac ip name ..."); "" when that
    // line names none. name is left alone when no line holds mac or mac is empty.
    static void FindLeaseName(const std::vector<std::string>& leases, const std::string& mac,
                              std::string& name);
    int GetNmbInfoByIP(const std::string& ip, std::string& name);
    static void* WaitProcessFinish(void*);

  private:
    ArpScanner() = default;

    int topology = 0;
    pthread_t thread = {};
    static std::atomic<bool> scanning_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
