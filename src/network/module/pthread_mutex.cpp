#include "network/module/pthread_mutex.h"

#include <cstring>

#include "utils/log.h"

namespace vornnetwork {
namespace network {

PthreadMutex::PthreadMutex() {
    std::memset(&mutex_, 0, sizeof(mutex_));
    if (pthread_mutex_init(&mutex_, nullptr) != 0) {
        VORN_LOG(LOG_ERR, "Failed to init mutex");
    }
}

PthreadMutex::~PthreadMutex() {
    pthread_mutex_destroy(&mutex_);
}

}  // namespace network
}  // namespace vornnetwork
