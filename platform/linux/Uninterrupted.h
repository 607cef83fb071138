// Calls to the system that a signal may interrupt. Files that a server or a program serves let that happen,
// whatever the handler of the signal asks for.
#pragma once

#include <cerrno>
#include <type_traits>

namespace platform {

// A descriptor or a count of -1, or a pointer to nothing.
template <typename Result>
bool isFailure(Result result) {
    if constexpr (std::is_pointer_v<Result>)
        return !result;
    else
        return result < 0;
}

// What `call` answers in the end. errno, which is 0 before each call, means something where that is a failure
// alone: a call that succeeds may set it as well. Of readdir, 0 after nil is the end of the folder.
template <typename Call>
auto uninterrupted(const Call& call) {
    for (;;) {
        errno = 0;
        const auto result = call();
        if (!isFailure(result) || errno != EINTR)
            return result;
    }
}

}  // namespace platform
