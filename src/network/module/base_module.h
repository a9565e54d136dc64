#ifndef VORN_NETWORK_MODULE_BASE_MODULE_H
#define VORN_NETWORK_MODULE_BASE_MODULE_H

#include <json/json.h>

#include <string>

#include "network/event/base_event.h"
#include "network/event/event_handler.h"
#include "network/module/module_type.h"
#include "network/module/pthread_mutex.h"

namespace vornnetwork {
namespace network {
namespace module {

enum MODULE_STATUS {
    MODULE_STATUS_TERMINATED = 1,
    MODULE_STATUS_INITIALIZED = 2,
    MODULE_STATUS_STARTED = 3,
};

// A module of the network daemon: initialised, started and terminated by the module manager,
// answering JSON requests and optionally handling events.
class BaseModule {
  public:
    explicit BaseModule(MODULE_TYPE type) : type_(type) {}
    virtual ~BaseModule() = default;
    BaseModule(const BaseModule&) = delete;
    BaseModule& operator=(const BaseModule&) = delete;

    virtual int ProcessRequest(const Json::Value& request, Json::Value& answer);
    virtual std::string ToStr() const;
    virtual int InitialModule() = 0;
    virtual int TerminateModule() = 0;
    virtual int StartModule() = 0;
    virtual int HookEvents() const { return 0; }

    static bool IsValidModule(MODULE_TYPE type);

    int Initialize();
    int Start();
    int Terminate();

    int HookEvent(event::EVENT_TYPE event, EventHandler::Handler handler) const;
    int UnHookEvent(event::EVENT_TYPE event) const;

    bool Lock() { return mutex_.Lock(); }
    bool Unlock() { return mutex_.Unlock(); }
    bool Trylock() { return mutex_.TryLock(); }

    int GetStatus() const { return status_; }
    MODULE_TYPE GetType() const { return type_; }

  private:
    int status_ = MODULE_STATUS_TERMINATED;
    MODULE_TYPE type_;
    PthreadMutex mutex_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
