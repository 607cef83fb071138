#include "apps/media-reader/Sandbox.h"

#include "apps/media-reader/Landlock.h"
#include "apps/media-reader/SystemCallFilter.h"

namespace reader {

// The filter comes last: it refuses the calls by which the other wall is put up.
std::vector<std::string> enterSandbox() {
    std::vector<std::string> walls;
    if (denyFilesAndNetwork())
        walls.push_back("landlock");
    if (allowOnlyDecoding())
        walls.push_back("seccomp");
    return walls;
}

}  // namespace reader
