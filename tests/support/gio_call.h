#ifndef VORN_TEST_GIO_CALL_H
#define VORN_TEST_GIO_CALL_H

#include <gio/gio.h>

#include <chrono>
#include <string>

namespace vorn {
namespace test {

// The outcome of one call: the reply's text, or the error reply's name and its own message.
struct ServiceAnswer {
    bool ok = false;
    std::string text;
    std::string errorName;
};

// One blocking call of a service's method on the session bus through GIO (object "/", interface
// named like the service); parameters is a floating GVariant tuple.
ServiceAnswer CallService(const char* service, const char* method, GVariant* parameters,
                          std::chrono::milliseconds timeout);

}  // namespace test
}  // namespace vorn

#endif
