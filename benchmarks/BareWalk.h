// The floor of a first load: a walk over libraries that looks at all that a load has to look at, and keeps
// nothing of it.
#pragma once

#include <string>

namespace bench {

// What the walk came by.
struct BareWalk {
    long folders = 0;
    long clips = 0;
    long projects = 0;
    long trailers = 0;
};

// Changes the working folder of the process.
BareWalk walkLibraries(const std::string& home);

}  // namespace bench
