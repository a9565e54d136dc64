#ifndef VORN_PLATFORM_SPAWN_SETUP_H
#define VORN_PLATFORM_SPAWN_SETUP_H

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>

// The setup of every program the platform starts through posix_spawn.
namespace vorn {
namespace platform {

// The child starts with default signal handling and nothing blocked, whatever the calling
// thread has set up; optionally in a process group of its own, so that it can be killed whole.
class SpawnAttributes {
  public:
    explicit SpawnAttributes(bool ownProcessGroup = false) {
        posix_spawnattr_init(&attr_);
        sigset_t none;
        sigset_t all;
        sigemptyset(&none);
        sigfillset(&all);
        posix_spawnattr_setsigmask(&attr_, &none);
        posix_spawnattr_setsigdefault(&attr_, &all);
        short flags = POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF;
        if (ownProcessGroup) {
            posix_spawnattr_setpgroup(&attr_, 0);
            flags |= POSIX_SPAWN_SETPGROUP;
        }
        posix_spawnattr_setflags(&attr_, flags);
    }
    ~SpawnAttributes() { posix_spawnattr_destroy(&attr_); }
    SpawnAttributes(const SpawnAttributes&) = delete;
    SpawnAttributes& operator=(const SpawnAttributes&) = delete;
    const posix_spawnattr_t* Get() const { return &attr_; }

  private:
    posix_spawnattr_t attr_;
};

// Standard streams a child does not share with the caller.
class SpawnActions {
  public:
    SpawnActions() { posix_spawn_file_actions_init(&actions_); }
    ~SpawnActions() { posix_spawn_file_actions_destroy(&actions_); }
    SpawnActions(const SpawnActions&) = delete;
    SpawnActions& operator=(const SpawnActions&) = delete;

    void Silence(int fd, int openFlags) {
        posix_spawn_file_actions_addopen(&actions_, fd, "/dev/null", openFlags, 0);
    }
    const posix_spawn_file_actions_t* Get() const { return &actions_; }

  private:
    posix_spawn_file_actions_t actions_;
};

}  // namespace platform
}  // namespace vorn

#endif
