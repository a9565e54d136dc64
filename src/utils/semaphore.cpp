#include "utils/semaphore.h"

#include <sys/ipc.h>
#include <sys/sem.h>

#include <cerrno>

#include "utils/log.h"

namespace vornwireless {
namespace semaphore {
namespace {

// semctl's fourth argument; the C library leaves its definition to the caller.
union SemaphoreArgument {
    int val;
    semid_ds* buf;
    unsigned short* array;
};

constexpr int kPermissions = 0666;

}  // namespace

int Semaphore::Get(int* semid) const {
    if (semid == nullptr) {
        return -1;
    }
    const key_t key = static_cast<key_t>(key_);
    int id = semget(key, 1, IPC_CREAT | IPC_EXCL | kPermissions);
    if (id >= 0) {
        SemaphoreArgument initial;
        initial.val = 1;
        if (semctl(id, 0, SETVAL, initial) < 0) {
            return -1;
        }
    } else if (errno == EEXIST) {
        id = semget(key, 1, kPermissions);
        if (id < 0) {
            return -1;
        }
    } else {
        return -1;
    }
    *semid = id;
    return 0;
}

int Semaphore::Enter() const {
    return Change(-1);
}

int Semaphore::Release() const {
    return Change(1);
}

int Semaphore::Change(short delta) const {
    int semid = -1;
    if (Get(&semid) == 0) {
        sembuf operation = {};
        operation.sem_num = 0;
        operation.sem_op = delta;
        operation.sem_flg = SEM_UNDO;
        // A signal arriving while we wait is not a failure to enter.
        int result;
        do {
            result = semop(semid, &operation, 1);
        } while (result < 0 && errno == EINTR);
        if (result == 0) {
            return 0;
        }
    }
    VORN_LOG(LOG_ERR, "semop fail semid %d errno %d", semid, errno);
    return -1;
}

}  // namespace semaphore
}  // namespace vornwireless
