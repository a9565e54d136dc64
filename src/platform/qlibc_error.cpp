#include "platform/qlibc_error.h"

namespace {
thread_local int lastError = QLIBC_ERR_NONE;
}

extern "C" {

int QLIBCErrGet(void) {
    return lastError;
}

void QLIBCErrSet(int code) {
    lastError = code;
}

}  // extern "C"
