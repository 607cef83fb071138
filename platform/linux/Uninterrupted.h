// Calls to the system that a signal may interrupt. Files that a server or a program serves let that happen,
// whatever the handler of the signal asks for.
#pragma once

#include <cerrno>

namespace platform {

// What `call`, which sets errno where it fails, answers in the end. errno is 0 where it did not fail.
template <typename Call>
auto uninterrupted(const Call& call) {
    for (;;) {
        errno = 0;
        const auto result = call();
        if (errno != EINTR)
            return result;
    }
}

}  // namespace platform
