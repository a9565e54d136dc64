#ifndef VORN_NETWORK_MODULE_CVSCANNER_H
#define VORN_NETWORK_MODULE_CVSCANNER_H

#include <pthread.h>

#include <atomic>
#include <string>

#include "network/module/clientlist.h"

namespace vornnetwork {
namespace network {
namespace module {

// Appliances of the system's own family, from the list file the platform's host discovery leaves.
// A discovery runs on a detached thread, one at a time.
class CVScanner : public ClientList {
  public:
    static CVScanner* Inst();

    // Starts a discovery when none runs, reads the list the previous one left, returns it and
    // empties the list.
    Json::Value GetData();
    int Start() { return 0; }
    int Stop() { return 0; }
    // Whether a discovery thread is still at work.
    static bool IsScanning() { return scanning_; }

    void BoardcastFindHost();
    int ReadFHOSTListFile();
    static void* WaitBoardcastFinish(void*);

  private:
    CVScanner() = default;
    // One line of the list: "model,model name,name,IPv4,MAC".
    void AppendHost(const std::string& line);

    pthread_t thread = {};
    static std::atomic<bool> scanning_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
