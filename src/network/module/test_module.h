#ifndef VORN_NETWORK_MODULE_TEST_MODULE_H
#define VORN_NETWORK_MODULE_TEST_MODULE_H

#include "network/module/base_module.h"

namespace vornnetwork {
namespace network {
namespace module {

// The smallest module: logs its lifecycle and subscribes to the hello event.
class TestModule : public BaseModule {
  public:
    TestModule();
    ~TestModule() override;

    int ProcessRequest(const Json::Value& request, Json::Value& answer) override;
    int InitialModule() override;
    int TerminateModule() override;
    int StartModule() override;
    int HookEvents() const override;

    int OnHelloEvent(const event::BaseEvent* event);

    static BaseModule* Create() { return new TestModule(); }
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
