#include "network/event/hello_event.h"

#include <sstream>

#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace event {

std::string HelloEvent::ToStr() const {
    std::ostringstream text;
    text << BaseEvent::ToStr() << "/ msg:[" << msg_ << "]" << std::endl;
    return text.str();
}

int HelloEvent::ProcessEvent() {
    VORN_LOG(LOG_ERR, "process by hello event");
    return 0;
}

}  // namespace event
}  // namespace network
}  // namespace vornnetwork
