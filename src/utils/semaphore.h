#ifndef VORN_UTILS_SEMAPHORE_H
#define VORN_UTILS_SEMAPHORE_H

#include <cstdint>

namespace vornwireless {
namespace semaphore {

// A cross-process lock: one System V semaphore found by key on every call. A holder that dies
// releases it (SEM_UNDO).
class Semaphore {
  public:
    explicit Semaphore(uint32_t key) : key_(key) {}

    // The set's id, creating it with value 1 when it does not exist yet. 0 or -1.
    int Get(int* semid) const;
    // Blocks while another holder is inside. 0 or -1.
    int Enter() const;
    int Release() const;

  private:
    int Change(short delta) const;

    uint32_t key_;
};

}  // namespace semaphore
}  // namespace vornwireless

#endif
