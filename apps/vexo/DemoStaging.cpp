#include "apps/vexo/DemoStaging.h"

#include <fmt/format.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "apps/vexo/Paths.h"

namespace vexo {
namespace {

namespace fs = std::filesystem;

constexpr const char* advice = "name a folder that does not exist or is empty";

// Nil where `folder` is a folder that is empty.
std::optional<std::string> occupied(const std::string& folder) {
    std::error_code error;
    if (!fs::is_directory(folder, error))
        return fmt::format("'{}' is not a folder; {}", folder, advice);
    const bool empty = fs::is_empty(folder, error);
    if (error)
        return fmt::format("cannot list '{}': {}", folder, error.message());
    if (!empty)
        return fmt::format("'{}' is not empty; {}", folder, advice);
    return std::nullopt;
}

std::string cannotWrite(const std::string& folder, int error) {
    return fmt::format("cannot write into the folder '{}': {}", folder, std::strerror(error));
}

std::optional<std::string> moveTo(const std::string& from, const std::string& to) {
    // Of what came up there meanwhile, the system lets a folder replace an empty folder alone.
    if (std::rename(from.c_str(), to.c_str()) == 0)
        return std::nullopt;
    return fmt::format("cannot make '{}': {}", to, std::strerror(errno));
}

}  // namespace

DemoStaging::DemoStaging(const std::string& destination) : destination_(absolutePath(destination)) {
    if (destination.empty())
        problem_ = fmt::format("the folder has no name; {}", advice);
    else
        begin();
}

// An empty folder that is there is filled rather than replaced: it may be somebody's working directory, a
// mount point, or in a folder that is not ours to write.
void DemoStaging::begin() {
    std::error_code unknown;
    destinationExists_ = fs::exists(fs::symlink_status(destination_, unknown));
    if (destinationExists_ && (problem_ = occupied(destination_)))
        return;
    const std::string folder =
        destinationExists_ ? destination_ : fs::path(destination_).parent_path().string();
    std::string hidden = folder + "/.vexo-demo-XXXXXX";
    if (!mkdtemp(hidden.data())) {
        problem_ = cannotWrite(folder, errno);
        return;
    }
    hidden_ = hidden;
    if (mkdir(path().c_str(), 0777) != 0)
        problem_ = cannotWrite(folder, errno);
}

DemoStaging::~DemoStaging() {
    std::error_code ignored;
    if (!hidden_.empty())
        fs::remove_all(hidden_, ignored);
}

std::optional<std::string> DemoStaging::publish() const {
    if (!destinationExists_)
        return moveTo(path(), destination_);
    std::error_code error;
    for (const fs::directory_entry& entry : fs::directory_iterator(path(), error)) {
        if (std::optional<std::string> problem =
                moveTo(entry.path(), destination_ + "/" + entry.path().filename().string()))
            return problem;
    }
    return error ? std::optional<std::string>(error.message()) : std::nullopt;
}

}  // namespace vexo
