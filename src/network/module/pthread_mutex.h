#ifndef VORN_NETWORK_MODULE_PTHREAD_MUTEX_H
#define VORN_NETWORK_MODULE_PTHREAD_MUTEX_H

#include <pthread.h>

namespace vornnetwork {
namespace network {

class PthreadMutex {
  public:
    PthreadMutex();
    ~PthreadMutex();
    PthreadMutex(const PthreadMutex&) = delete;
    PthreadMutex& operator=(const PthreadMutex&) = delete;

    bool Lock() { return pthread_mutex_lock(&mutex_) == 0; }
    bool Unlock() { return pthread_mutex_unlock(&mutex_) == 0; }
    bool TryLock() { return pthread_mutex_trylock(&mutex_) == 0; }

  private:
    pthread_mutex_t mutex_;
};

}  // namespace network
}  // namespace vornnetwork

#endif
