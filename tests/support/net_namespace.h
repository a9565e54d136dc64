#ifndef VORN_TEST_NET_NAMESPACE_H
#define VORN_TEST_NET_NAMESPACE_H

#include <gtest/gtest.h>

#include <string>

namespace vorn {
namespace test {

// Moves the calling thread, and every process and thread it starts afterwards, into fresh network
// and mount namespaces: mounts stay private, /sys shows the new namespace's links, and lo is up.
// Call it before starting threads. false with the reason in why; notPermitted (when given) tells
// whether the reason is that namespaces cannot be had here at all (not root, unshare refused).
bool EnterPrivateNetworkNamespace(std::string* why, bool* notPermitted = nullptr);

}  // namespace test
}  // namespace vorn

// In a system test body: enter a private network namespace, skip the test where namespaces cannot
// be had, fail it when setting the namespace up goes wrong.
#define VORN_ENTER_PRIVATE_NETWORK_NAMESPACE_OR_SKIP()                                 \
    do {                                                                               \
        std::string vornNamespaceWhy;                                                  \
        bool vornNamespaceNotPermitted = false;                                        \
        if (!::vorn::test::EnterPrivateNetworkNamespace(&vornNamespaceWhy,             \
                                                        &vornNamespaceNotPermitted)) { \
            if (vornNamespaceNotPermitted) {                                           \
                GTEST_SKIP() << vornNamespaceWhy;                                      \
            }                                                                          \
            FAIL() << vornNamespaceWhy;                                                \
        }                                                                              \
    } while (false)

#endif
