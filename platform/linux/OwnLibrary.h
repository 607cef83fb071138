// Where this library itself lies, which tells where its programs, plug-ins and modules do.
#pragma once

#include <string>

namespace platform {

// The folder of the shared library that this code is in, links resolved; "/" where it can't be told, which
// nobody but root can put anything into. Callable from any thread.
std::string ownLibraryFolder();

}  // namespace platform
