#ifndef VORN_NETWORK_EVENT_BASE_EVENT_H
#define VORN_NETWORK_EVENT_BASE_EVENT_H

#include <cstdint>
#include <string>

namespace vornnetwork {
namespace network {
namespace event {

enum EVENT_TYPE : std::int32_t {
    EVENT_HELLO = 1,
    EVENT_RESERVED_2 = 2,
};

// An event is delivered to the subscribed modules, then processed by itself, each at most once.
class BaseEvent {
  public:
    explicit BaseEvent(EVENT_TYPE type) : type_(type) {}
    virtual ~BaseEvent() = default;

    virtual bool IsValid() const = 0;
    virtual std::string ToStr() const;
    virtual int ProcessEvent() { return 0; }

    static bool IsValidEvent(EVENT_TYPE type);

    // Delivers the event to the module manager, then processes it. 0 or -1.
    int Process();
    int NotifyModuleManager();
    int PostProcess();

    EVENT_TYPE GetType() const { return type_; }
    bool IsNotified() const { return notified_; }
    bool IsProcessed() const { return processed_; }

  private:
    EVENT_TYPE type_;
    bool notified_ = false;
    bool processed_ = false;
};

}  // namespace event
}  // namespace network
}  // namespace vornnetwork

#endif
