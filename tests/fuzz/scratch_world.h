#ifndef VORN_FUZZ_SCRATCH_WORLD_H
#define VORN_FUZZ_SCRATCH_WORLD_H

#include <sched.h>
#include <stdlib.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <initializer_list>
#include <string>

#include "platform/root_path.h"
#include "utils/log.h"

// A target's world, entered once before the first input: a scratch appliance root (VORN_ROOT)
// holding the given folders and removed at exit, a network namespace of its own so that nothing
// an input sets off reaches this machine's network, and no log output.
inline void EnterScratchWorld(std::initializer_list<const char*> folders) {
    // On tmpfs where there is one: the writers' fsync costs nothing there.
    static std::string root =
        std::string(access("/dev/shm", W_OK) == 0 ? "/dev/shm" : "/tmp") + "/vorn-fuzz-XXXXXX";
    // Without root a user namespace grants the network namespace.
    if ((unshare(CLONE_NEWNET) != 0 && unshare(CLONE_NEWUSER | CLONE_NEWNET) != 0) ||
        mkdtemp(&root[0]) == nullptr) {
        std::perror("fuzz: no private network namespace or scratch root");
        std::abort();
    }
    std::atexit([] { std::filesystem::remove_all(root); });
    setenv("VORN_ROOT", root.c_str(), 1);
    for (const char* folder : folders) {
        std::filesystem::create_directories(vorn::platform::RootPath(folder));
    }
    vorn::log::SetSink([](int, const std::string&) {});
}

#endif
