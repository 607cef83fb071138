#include "platform/linux/HiddenNames.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <ctime>

#include "platform/Path.h"
#include "platform/linux/PlainFile.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

constexpr std::size_t largestHiddenFile = 256 * 1024;
constexpr std::size_t mostFoldersKept = 64;

// Clocks of file systems are coarse, FAT's counts in steps of two seconds: a file that was changed just now
// may change again without showing it.
bool wasChangedJustNow(std::int64_t seconds) {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    return seconds >= now.tv_sec - 2;
}

}  // namespace

NameSet namesInHiddenFile(std::string_view content) {
    NameSet names;
    while (!content.empty()) {
        const auto line = content.substr(0, content.find('\n'));
        if (!line.empty())
            names.emplace(line);
        content.remove_prefix(std::min(line.size() + 1, content.size()));
    }
    return names;
}

bool HiddenNames::contains(const std::string& folder, std::string_view name) const {
    const auto names = ofFolder(folder);
    return names && names->contains(name);
}

std::shared_ptr<const NameSet> HiddenNames::ofFolder(const std::string& folder) const {
    const std::string path = path::appending(folder, ".hidden");
    struct statx status {};
    const int result = uninterrupted(
        [&] { return statx(AT_FDCWD, path.c_str(), AT_NO_AUTOMOUNT, STATX_BASIC_STATS, &status); });
    if (result != 0)
        return nullptr;
    const Version version{std::uint64_t{status.stx_dev_major} << 32 | status.stx_dev_minor, status.stx_ino,
                          status.stx_size, status.stx_ctime.tv_sec, status.stx_ctime.tv_nsec};
    if (auto names = keptNames(folder, version))
        return names;
    // One that can't be read now may be readable the next time.
    const auto content = beginningOfPlainFile(path, largestHiddenFile);
    if (!content)
        return nullptr;
    auto names = std::make_shared<const NameSet>(namesInHiddenFile(*content));
    if (!wasChangedJustNow(version.seconds))
        keep(folder, {version, names});
    return names;
}

std::shared_ptr<const NameSet> HiddenNames::keptNames(const std::string& folder,
                                                      const Version& version) const {
    Locked lock(mutex_);
    const auto found = entries_.find(folder);
    return found != entries_.end() && found->second.version == version ? found->second.names : nullptr;
}

// A scan goes through one folder after another, so starting over costs it nothing.
void HiddenNames::keep(const std::string& folder, Entry entry) const {
    Locked lock(mutex_);
    if (entries_.size() >= mostFoldersKept)
        entries_.clear();
    entries_.insert_or_assign(folder, std::move(entry));
}

}  // namespace platform
