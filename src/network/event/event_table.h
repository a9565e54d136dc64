#ifndef VORN_NETWORK_EVENT_EVENT_TABLE_H
#define VORN_NETWORK_EVENT_EVENT_TABLE_H

#include <map>
#include <string>
#include <vector>

#include "network/event/base_event.h"
#include "network/event/event_handler.h"

namespace vornnetwork {
namespace network {
namespace module {

// Event type -> handlers in registration order; at most one handler per module and event, and no
// event without handlers.
class EventTable {
  public:
    using Handlers = std::vector<EventHandler>;
    using Table = std::map<event::EVENT_TYPE, Handlers>;
    using iterator = Table::iterator;

    int Add(event::EVENT_TYPE type, const EventHandler& handler);
    int Remove(event::EVENT_TYPE type, MODULE_TYPE module);
    int Remove(iterator entry, MODULE_TYPE module);
    bool RemoveModule(MODULE_TYPE module);

    const Handlers& ListHandlers(event::EVENT_TYPE type);
    const Handlers& ListHandlers(iterator entry);
    iterator FindEvent(event::EVENT_TYPE type) { return table_.find(type); }
    bool IsEventExist(event::EVENT_TYPE type) const { return table_.count(type) != 0; }

    static Handlers::iterator FindModule(Handlers& handlers, MODULE_TYPE module);
    static Handlers::const_iterator FindConstModule(const Handlers& handlers, MODULE_TYPE module);

    std::string ToStr() const;

  private:
    const Handlers empty_{};
    Table table_;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
