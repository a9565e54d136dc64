#ifndef VORN_NETWORK_MODULE_CLIENTLIST_H
#define VORN_NETWORK_MODULE_CLIENTLIST_H

#include <json/json.h>
#include <pthread.h>

#include <string>

#include "network/module/client_index.h"

namespace vornnetwork {
namespace network {
namespace module {

// A locked JSON list of the clients of the local network, {"ClientList": [ {...}, ... ]}, keyed
// by MAC or IP address. Base of the four scanners and the device list's merged list.
class ClientList {
  public:
    ClientList();
    virtual ~ClientList();
    ClientList(const ClientList&) = delete;
    ClientList& operator=(const ClientList&) = delete;

    // Merge obj into the entry of that MAC (IP); with add, a client not yet listed is appended.
    bool UpdateKeysByMac(const std::string& mac, const Json::Value& obj, const bool& add);
    bool UpdateKeysByIP(const std::string& ip, const Json::Value& obj, const bool& add);

    bool VerifyMacIsExist(const std::string& mac, unsigned& index);
    bool VerifyIPIsExist(const std::string& ip, unsigned& index);
    std::string FindMacByIP(const std::string& ip);
    std::string FindKey(const std::string& mac, const std::string& key);
    bool GetObject(const std::string& mac, Json::Value& out);

    void EraseList();
    bool EraseObject(const std::string& mac);
    Json::Value GetClientList();
    // A scanner that runs in the background answers with its last finished scan: the working list
    // is swapped in whole when a scan ends, so no caller sees a scan half done or just emptied.
    void PublishScan();
    Json::Value GetFinishedList();

    bool WriteToFile(const std::string& path);
    bool LoadClientList(const std::string& path);
    bool Load(const std::string& path) { return LoadClientList(path); }

    void DetermineDisplayName(const Json::Value& obj, std::string& name);
    std::string GetLocalTime();

  protected:
    // Holds the list's mutex for one scope.
    class ListLock {
      public:
        explicit ListLock(pthread_mutex_t& mutex) : mutex_(mutex) { pthread_mutex_lock(&mutex_); }
        ~ListLock() { pthread_mutex_unlock(&mutex_); }
        ListLock(const ListLock&) = delete;
        ListLock& operator=(const ListLock&) = delete;

      private:
        pthread_mutex_t& mutex_;
    };

    pthread_mutex_t mutex;
    // Read-only for the scanners: the look-up indexes below follow the changes made through the
    // methods above.
    Json::Value root;
    Json::Value finished_;

  private:
    bool Merge(ClientIndex& by, const std::string& text, const Json::Value& obj, bool add,
               const std::string& time);
    void ForgetIndexes();

    ClientIndex byMac_;
    ClientIndex byIp_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
