#ifndef VORN_TEST_PEER_NAMESPACE_H
#define VORN_TEST_PEER_NAMESPACE_H

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "support/log_capture.h"
#include "support/private_bus.h"
#include "support/sim_root.h"

namespace vorn {
namespace test {

// Base fixture of system tests whose uplinks are veth pairs with their far ends in namespaces of
// their own. The test runs in a private network namespace over a live root whose named routing
// tables the real ip sees; neither side runs duplicate address detection, so addresses work at
// once. A derived fixture lays out its links in SetUpPeers, which runs only once the namespace is
// ready.
class PeerNamespaceTest : public ::testing::Test {
  protected:
    void SetUp() final;
    virtual void SetUpPeers() {}
    // Stops the programs, then removes the namespaces; a derived TearDown calls it last.
    void TearDown() override;

    // A veth pair: near (index nearIndex) here, far (index farIndex) in the new namespace peer;
    // both ends up and the carrier seen.
    void AddPeer(const std::string& peer, const std::string& near, int nearIndex,
                 const std::string& far, int farIndex);
    // The real ip with these arguments (shell words) succeeds.
    void Ip(const std::string& arguments) const;
    // The link's carrier flag as /sys shows it: "1", "0", or "" for no such link.
    static std::string Carrier(const std::string& ifname);
    // A program of the host, run in the namespace peer (here when peer is empty).
    DaemonProcess& Start(std::vector<std::string> argv, const std::string& peer = "");

    LogCapture log_;
    std::unique_ptr<SimRoot> root_;

  private:
    void EnterNamespace();

    std::vector<std::string> peers_;
    std::vector<std::unique_ptr<DaemonProcess>> programs_;
};

}  // namespace test
}  // namespace vorn

#endif
