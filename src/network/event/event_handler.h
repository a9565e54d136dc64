#ifndef VORN_NETWORK_EVENT_EVENT_HANDLER_H
#define VORN_NETWORK_EVENT_EVENT_HANDLER_H

#include "network/event/base_event.h"
#include "network/module/module_type.h"

namespace vornnetwork {
namespace network {
namespace module {

class BaseModule;

// A module's subscription to an event: its type and the member function that handles it.
struct EventHandler {
    using Handler = int (BaseModule::*)(const event::BaseEvent*);

    EventHandler() = default;
    EventHandler(MODULE_TYPE type, Handler function) : module(type), handler(function) {}

    bool IsModule(MODULE_TYPE type) const { return module == type; }
    bool operator==(const EventHandler& other) const {
        return handler == other.handler && module == other.module;
    }

    MODULE_TYPE module = static_cast<MODULE_TYPE>(0);
    Handler handler = nullptr;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
