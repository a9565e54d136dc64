#include "utils/sdk_s.h"

#include <pthread.h>

#include "platform/qlibc_proc.h"
#include "utils/log.h"

namespace vornwireless {
namespace sdk_s {
namespace {

pthread_mutex_t wrapperMutex = PTHREAD_MUTEX_INITIALIZER;

// Holds the wrapper mutex for one platform call and logs its start and end; a wrapper is
// "Serialised guard("Name"); return Name(...);".
class Serialised {
  public:
    explicit Serialised(const char* function) : function_(function) {
        pthread_mutex_lock(&wrapperMutex);
        Log("start");
    }
    ~Serialised() {
        Log("end");
        pthread_mutex_unlock(&wrapperMutex);
    }
    Serialised(const Serialised&) = delete;
    Serialised& operator=(const Serialised&) = delete;

  private:
    void Log(const char* stage) const {
        VORN_LOG(LOG_DEBUG, "thread (%lu) func (%s) %s", static_cast<unsigned long>(pthread_self()),
                 function_, stage);
    }

    const char* function_;
};

}  // namespace

int QLIBCExec_S(const char* prog, const char* a1, const char* a2, const char* a3, const char* a4) {
    Serialised guard("QLIBCExec");
    return QLIBCExec(prog, a1, a2, a3, a4);
}

int QLIBNetIfLinkDownEvent_S(const char* ifname) {
    Serialised guard("QLIBNetIfLinkDownEvent");
    return QLIBNetIfLinkDownEvent(ifname);
}

int QLIBNetIfLinkUpEvent_S(const char* ifname) {
    Serialised guard("QLIBNetIfLinkUpEvent");
    return QLIBNetIfLinkUpEvent(ifname);
}

int QLIBPluginAction_S(int action, QLIBPLUGIN* handle) {
    Serialised guard("QLIBPluginAction");
    return QLIBPluginAction(action, handle);
}

int NetRoutetableHandler_S(int action, const char* ifname) {
    Serialised guard("NetRoutetableHandler");
    return NetRoutetableHandler(action, ifname);
}

int VORNNetIFGetInfo_S(const char* ifname, int flags, VORN_NET_IF_CONFIG* info) {
    Serialised guard("VORNNetIFGetInfo");
    return VORNNetIFGetInfo(ifname, flags, info);
}

int BlVORNLnxIsDHCP_S(const char* ifname) {
    Serialised guard("BlVORNLnxIsDHCP");
    return BlVORNLnxIsDHCP(ifname);
}

int VORNNetSetCard1_S(const VORN_NET_IF_CONFIG* info, int flags) {
    Serialised guard("VORNNetSetCard1");
    return VORNNetSetCard1(info, flags);
}

int VORNNetDNSUpdate_S() {
    Serialised guard("VORNNetDNSUpdate");
    return VORNNetDNSUpdate();
}

}  // namespace sdk_s
}  // namespace vornwireless
