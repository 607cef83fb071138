#include "platform/linux/OwnLibrary.h"

#include <dlfcn.h>

#include <filesystem>

namespace platform {

std::string ownLibraryFolder() {
    Dl_info library{};
    std::error_code unknown;
    if (dladdr(reinterpret_cast<const void*>(&ownLibraryFolder), &library) && library.dli_fname)
        if (const auto file = std::filesystem::canonical(library.dli_fname, unknown); !unknown)
            return file.parent_path();
    return "/";
}

}  // namespace platform
