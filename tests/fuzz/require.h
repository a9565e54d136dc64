#ifndef VORN_FUZZ_REQUIRE_H
#define VORN_FUZZ_REQUIRE_H

#include <cstdlib>

// A broken property aborts, so that libFuzzer keeps the input that broke it.
inline void Require(bool condition) {
    if (!condition) {
        std::abort();
    }
}

#endif
