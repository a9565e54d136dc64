#ifndef VORN_NETWORK_MODULE_MODULE_MANAGER_H
#define VORN_NETWORK_MODULE_MODULE_MANAGER_H

#include <json/json.h>

#include <map>

#include "network/event/base_event.h"
#include "network/event/event_table.h"
#include "network/module/base_module.h"

namespace vornnetwork {
namespace network {
namespace module {

// Creates the daemon's modules from a fixed table, runs their lifecycle in ascending type order,
// delivers events to their handlers and routes requests by module type. Takes no lock: Initialize
// and Start run once before requests are served.
class ModuleManager {
  public:
    struct MODULE_INFO {
        MODULE_TYPE type;
        bool enabled;
        BaseModule* (*create)();
    };
    using Modules = std::map<MODULE_TYPE, BaseModule*>;

    static ModuleManager* GetInstance();

    bool Initialize();
    bool InitModules();
    bool Start();

    bool AddModule(const MODULE_INFO& info);
    // Terminates and deletes a module. Returns whether the module still exists: true for an
    // absent type, false after a real removal (callers rely on this inversion).
    bool RemoveModule(MODULE_TYPE type);
    BaseModule* GetModule(MODULE_TYPE type);
    Modules::iterator FindModule(MODULE_TYPE type) { return modules_.find(type); }
    bool IsModuleExist(MODULE_TYPE type) const { return modules_.count(type) != 0; }

    int HookEvent(event::EVENT_TYPE event, MODULE_TYPE module, EventHandler::Handler handler);
    int UnHookEvent(event::EVENT_TYPE event, MODULE_TYPE module);
    int NotifyEvent(const event::BaseEvent* event);
    int ProcessRequest(MODULE_TYPE type, const Json::Value& request, Json::Value& answer);
    void Dump() const;

    static const MODULE_INFO module_info[5];

  private:
    ModuleManager() = default;
    ModuleManager(const ModuleManager&) = delete;
    ModuleManager& operator=(const ModuleManager&) = delete;

    template <typename Step>
    bool ForEachModule(Step step, const char* failure);

    // Modules live until RemoveModule or process exit; they are not deleted with the manager, so
    // that no module thread outlives the module it runs in during exit.
    Modules modules_;
    EventTable event_table_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
