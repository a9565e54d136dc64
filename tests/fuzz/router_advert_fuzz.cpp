// Router advertisements as the listening socket hands them over, on the appliance's lo: the
// option walk reads nothing outside the packet, and the state machine leaves the interface in a
// known state whose prefix is empty or an IPv6 address.
#include <arpa/inet.h>
#include <netinet/in.h>

#include <cstddef>
#include <cstdint>
#include <fstream>
#include <vector>

#include "network/module/ipv6_module.h"
#include "platform/root_path.h"
#include "require.h"
#include "scratch_world.h"

namespace {

using vornnetwork::network::module::InterfaceContext;
using vornnetwork::network::module::IPv6Module;

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    EnterScratchWorld({"/etc/sysconfig/network-scripts"});
    // Configured by advertisements, so that they reach the state machine.
    std::ofstream(vorn::platform::RootPath("/etc/sysconfig/network-scripts/ifcfg-lo"))
        << "DEVICE=lo\nIPV6INIT=yes\nIPV6_AUTOCONF=yes\n";
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size > IPv6Module::kPacketBytes) {
        return 0;
    }
    static IPv6Module module;
    sockaddr_in6 from{};
    from.sin6_family = AF_INET6;
    inet_pton(AF_INET6, "fe80::1", &from.sin6_addr);
    in6_pktinfo info{};
    info.ipi6_ifindex = 1;  // lo, the first interface of a fresh namespace
    const std::vector<unsigned char> packet(data, data + size);
    module.HandlePacket(packet.data(), static_cast<int>(size), from, info);
    for (const auto& context : module.GetContexts()) {
        in6_addr prefix;
        Require(context.second.prefix.empty() ||
                inet_pton(AF_INET6, context.second.prefix.c_str(), &prefix) == 1);
        Require(context.second.state >= InterfaceContext::STATE_NONE &&
                context.second.state <= InterfaceContext::STATE_OTHER);
    }
    return 0;
}
