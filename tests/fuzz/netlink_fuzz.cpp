// Netlink notices as one read brings them (link, address and route messages, truncated and
// oversized attributes): the walker reads nothing outside the read, counts no more messages than
// fit in it, and keeps only well-formed addresses on valid interface names.
#include <arpa/inet.h>
#include <linux/netlink.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "network/module/netlink_module.h"
#include "require.h"
#include "scratch_world.h"
#include "utils/interface_name.h"

namespace {

bool IsAddress(int family, const std::string& text) {
    unsigned char bytes[16];
    return inet_pton(family, text.c_str(), bytes) == 1;
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    EnterScratchWorld({});
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    // A buffer of exactly the read's size (and the allocator's alignment), so that the sanitizer
    // sees a read past its end.
    const std::vector<unsigned char> read(data, data + size);
    vornnetwork::network::module::NetlinkModule module;
    module.DispatchMessages(read.data(), read.size());
    const auto state = module.Snapshot();
    Require(state.messages <= size / NLMSG_HDRLEN);
    using vornwireless::utils::IsValidInterfaceName;
    for (const auto& link : state.links) {
        Require(IsValidInterfaceName(link.first));
    }
    for (const auto& present : state.ipv4Present) {
        Require(IsValidInterfaceName(present.first));
        for (const std::string& address : present.second) {
            Require(IsAddress(AF_INET, address));
        }
    }
    for (const auto& addresses : state.ipv6) {
        Require(IsValidInterfaceName(addresses.first));
        for (const std::string& address : addresses.second) {
            Require(IsAddress(AF_INET6, address));
        }
    }
    return 0;
}
