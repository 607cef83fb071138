#include <unistd.h>

#include <cstdlib>
#include <filesystem>

#include "framework/metadata/MediaReader.h"
#include "platform/linux/OwnLibrary.h"

namespace vexo {

namespace {

namespace fs = std::filesystem;

constexpr const char* programName = "vexo-media-reader";

fs::path besideRunningProgram() {
    std::error_code unknown;
    return fs::read_symlink("/proc/self/exe", unknown).parent_path() / programName;
}

fs::path installedProgram() {
    return (fs::path(platform::ownLibraryFolder()) / VEXO_PROGRAMS_FROM_LIBRARY / programName)
        .lexically_normal();
}

}  // namespace

std::string mediaReaderProgram() {
    if (const char* chosen = std::getenv("VEXO_MEDIA_READER"); chosen && *chosen)
        return chosen;
    const fs::path beside = besideRunningProgram();
    return access(beside.c_str(), X_OK) == 0 ? beside : installedProgram();
}

}  // namespace vexo
