#include "platform/linux/OwnLibrary.h"

#include <dlfcn.h>

#include <filesystem>

namespace platform {

std::string ownLibraryFolder() {
    Dl_info library{};
    if (!dladdr(reinterpret_cast<const void*>(&ownLibraryFolder), &library) || !library.dli_fname)
        return {};
    std::error_code unknown;
    const auto resolved = std::filesystem::canonical(library.dli_fname, unknown);
    return (unknown ? std::filesystem::path(library.dli_fname) : resolved).parent_path();
}

}  // namespace platform
