#include "network/event/event_table.h"

#include <algorithm>

#include "network/module/base_module.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {

int EventTable::Add(event::EVENT_TYPE type, const EventHandler& handler) {
    if (!event::BaseEvent::IsValidEvent(type)) {
        VORN_LOG(LOG_ERR, "event [%d] is invalid", type);
        return -1;
    }
    if (!BaseModule::IsValidModule(handler.module) || handler.handler == nullptr) {
        VORN_LOG(LOG_ERR, "invalid handler");
        return -1;
    }
    Handlers& handlers = table_[type];
    if (FindModule(handlers, handler.module) != handlers.end()) {
        VORN_LOG(LOG_ERR, "The module [%d] has been registered.", handler.module);
        return -1;
    }
    handlers.push_back(handler);
    return 0;
}

int EventTable::Remove(event::EVENT_TYPE type, MODULE_TYPE module) {
    return Remove(FindEvent(type), module);
}

int EventTable::Remove(iterator entry, MODULE_TYPE module) {
    if (entry == table_.end()) {
        return 0;
    }
    Handlers& handlers = entry->second;
    auto found = FindModule(handlers, module);
    if (found != handlers.end()) {
        handlers.erase(found);
    }
    if (handlers.empty()) {
        table_.erase(entry);
    }
    return 0;
}

bool EventTable::RemoveModule(MODULE_TYPE module) {
    int failures = 0;
    for (auto entry = table_.begin(); entry != table_.end();) {
        auto current = entry++;
        const event::EVENT_TYPE type = current->first;
        if (Remove(current, module) != 0) {
            VORN_LOG(LOG_ERR, "Failed to remove module [%d] from event [%d]", module, type);
            ++failures;
        }
    }
    return failures == 0;
}

const EventTable::Handlers& EventTable::ListHandlers(event::EVENT_TYPE type) {
    return ListHandlers(FindEvent(type));
}

const EventTable::Handlers& EventTable::ListHandlers(iterator entry) {
    return entry == table_.end() ? empty_ : entry->second;
}

EventTable::Handlers::iterator EventTable::FindModule(Handlers& handlers, MODULE_TYPE module) {
    return std::find_if(handlers.begin(), handlers.end(),
                        [module](const EventHandler& handler) { return handler.IsModule(module); });
}

EventTable::Handlers::const_iterator EventTable::FindConstModule(const Handlers& handlers,
                                                                 MODULE_TYPE module) {
    return std::find_if(handlers.begin(), handlers.end(),
                        [module](const EventHandler& handler) { return handler.IsModule(module); });
}

std::string EventTable::ToStr() const {
    std::string text;
    for (const auto& entry : table_) {
        text += "event[" + std::to_string(entry.first) + "]/ modules[";
        for (const auto& handler : entry.second) {
            text += std::to_string(handler.module) + ", ";
        }
        text += "]";
    }
    return text;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
