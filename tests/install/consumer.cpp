// A program outside the tree, built only from the installed headers and pkg-config.
#include <vornnetwork/utils/config.h>
#include <vornnetwork/utils/ip_address.h>

#include <cstdio>
#include <cstdlib>
#include <string>

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: consumer FILE\n");
        return 2;
    }
    using namespace vornwireless::utils;
    const IPAddress next = GetNextNetwork(IPAddress("192.168.1.77"), IPAddress("255.255.255.0"));
    ConfigSection config(argv[1]);
    config.AddKeyValue("lan", "next", next.ToString());
    if (config.Write() != 0) {
        return 1;
    }
    ConfigSection reread(argv[1]);
    if (reread.Read() != 0 || reread.GetKeyValue("lan", "next") != "192.168.2.0") {
        return 1;
    }
    std::printf("next network %s\n", next.ToString().c_str());
    return 0;
}
