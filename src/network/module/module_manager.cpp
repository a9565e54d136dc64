#include "network/module/module_manager.h"

#include "network/module/devicelist_module.h"
#include "network/module/ipv6_module.h"
#include "network/module/netlink_module.h"
#include "network/module/route_module.h"
#include "network/module/test_module.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {

const ModuleManager::MODULE_INFO ModuleManager::module_info[5] = {
    {MODULE_TEST, false, &TestModule::Create},
    {MODULE_NETLINK, true, &NetlinkModule::Create},
    {MODULE_IPV6, true, &IPv6Module::Create},
    {MODULE_ROUTE, true, &RouteModule::Create},
    {MODULE_DEVICE_LIST, true, &DeviceListModule::Create},
};

ModuleManager* ModuleManager::GetInstance() {
    static ModuleManager instance;
    return &instance;
}

bool ModuleManager::Initialize() {
    int failures = 0;
    for (const MODULE_INFO& row : module_info) {
        if (row.enabled && !AddModule(row)) {
            VORN_LOG(LOG_ERR, "Failed to initial module [%d]", row.type);
            ++failures;
        }
    }
    if (!InitModules()) {
        VORN_LOG(LOG_ERR, "Failed to initial modules");
        return false;
    }
    return failures == 0;
}

template <typename Step>
bool ModuleManager::ForEachModule(Step step, const char* failure) {
    int failures = 0;
    for (const auto& entry : modules_) {
        if (entry.second == nullptr) {
            VORN_LOG(LOG_ERR, "Null module pointer");
            ++failures;
        } else if (step(*entry.second) != 0) {
            VORN_LOG(LOG_ERR, "Failed to %s module [%d]", failure, entry.first);
            ++failures;
        }
    }
    return failures == 0;
}

bool ModuleManager::InitModules() {
    return ForEachModule([](BaseModule& module) { return module.Initialize(); }, "init");
}

bool ModuleManager::Start() {
    return ForEachModule([](BaseModule& module) { return module.Start(); }, "start");
}

bool ModuleManager::AddModule(const MODULE_INFO& info) {
    if (!info.enabled) {
        return true;
    }
    if (IsModuleExist(info.type)) {
        VORN_LOG(LOG_INFO, "The network module [%d] has been created.", info.type);
        return true;
    }
    BaseModule* module = info.create != nullptr ? info.create() : nullptr;
    if (module == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to create module [%d]", info.type);
        return false;
    }
    modules_[info.type] = module;
    return true;
}

bool ModuleManager::RemoveModule(MODULE_TYPE type) {
    auto found = modules_.find(type);
    if (found == modules_.end()) {
        return true;
    }
    if (found->second != nullptr) {
        if (found->second->Terminate() != 0) {
            VORN_LOG(LOG_ERR, "Failed to terminiate module [%d]", type);
        }
        delete found->second;
    }
    modules_.erase(found);
    return IsModuleExist(type);
}

BaseModule* ModuleManager::GetModule(MODULE_TYPE type) {
    auto found = modules_.find(type);
    return found == modules_.end() ? nullptr : found->second;
}

int ModuleManager::HookEvent(event::EVENT_TYPE event, MODULE_TYPE module,
                             EventHandler::Handler handler) {
    const int result = event_table_.Add(event, EventHandler(module, handler));
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to register event [%d] by module [%d] with ret=[%d]", event,
                 module, result);
    }
    return result;
}

int ModuleManager::UnHookEvent(event::EVENT_TYPE event, MODULE_TYPE module) {
    if (event_table_.Remove(event, module) != 0) {
        VORN_LOG(LOG_ERR, "Failed to unregister event [%d] by module [%d]", event, module);
        return -1;
    }
    return 0;
}

int ModuleManager::NotifyEvent(const event::BaseEvent* event) {
    if (event == nullptr) {
        VORN_LOG(LOG_ERR, "NULL Event Pointer");
        return -1;
    }
    if (!event->IsValid()) {
        VORN_LOG(LOG_ERR, "Invalid event [%s]", event->ToStr().c_str());
        return -1;
    }
    // A copy: a handler may unhook while the list is walked.
    const EventTable::Handlers handlers = event_table_.ListHandlers(event->GetType());
    int failures = 0;
    for (const EventHandler& handler : handlers) {
        BaseModule* module = GetModule(handler.module);
        if (module == nullptr) {
            VORN_LOG(LOG_ERR, "NULL pointer for module [%d]", handler.module);
            ++failures;
            continue;
        }
        const int result = (module->*handler.handler)(event);
        if (result != 0) {
            VORN_LOG(LOG_ERR, "Failed to handler event [%d] by module [%d] and ret=[%d]",
                     event->GetType(), handler.module, result);
            ++failures;
        }
    }
    return failures;
}

int ModuleManager::ProcessRequest(MODULE_TYPE type, const Json::Value& request,
                                  Json::Value& answer) {
    BaseModule* module = GetModule(type);
    if (module == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to find module [%d]", type);
        return -1;
    }
    const int result = module->ProcessRequest(request, answer);
    if (result != 0) {
        VORN_LOG(LOG_ERR, "Failed to process request from module [%d]", type);
    }
    return result;
}

void ModuleManager::Dump() const {
    for (const auto& entry : modules_) {
        if (entry.second != nullptr) {
            VORN_LOG(LOG_ERR, "module: [%s]", entry.second->ToStr().c_str());
        }
    }
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
