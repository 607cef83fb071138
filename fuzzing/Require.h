// How a fuzz target says what must hold whatever its input is: a breach ends the program, which the fuzzer
// counts as a crash and keeps the input of.
#pragma once

#include <cstdlib>

inline void require(bool condition) {
    if (!condition)
        std::abort();
}
