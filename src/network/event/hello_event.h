#ifndef VORN_NETWORK_EVENT_HELLO_EVENT_H
#define VORN_NETWORK_EVENT_HELLO_EVENT_H

#include <string>

#include "network/event/base_event.h"

namespace vornnetwork {
namespace network {
namespace event {

// The one concrete event: carries a text message.
class HelloEvent : public BaseEvent {
  public:
    explicit HelloEvent(const std::string& msg) : BaseEvent(EVENT_HELLO), msg_(msg) {}

    bool IsValid() const override { return !msg_.empty(); }
    std::string ToStr() const override;
    int ProcessEvent() override;

  private:
    std::string msg_;
};

}  // namespace event
}  // namespace network
}  // namespace vornnetwork

#endif
