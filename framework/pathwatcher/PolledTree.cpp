#include "framework/pathwatcher/PolledTree.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <functional>
#include <set>
#include <string_view>
#include <utility>

#include "framework/pathwatcher/PackageName.h"
#include "platform/Path.h"
#include "platform/linux/LinuxFolder.h"
#include "platform/linux/MountReach.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

namespace path = platform::path;

using platform::uninterrupted;

class Signature {
  public:
    template <typename... Numbers>
    explicit Signature(Numbers... numbers) {
        (add(static_cast<std::uint64_t>(numbers)), ...);
    }

    std::uint64_t value() const { return value_; }

  private:
    void add(std::uint64_t number) {
        constexpr std::uint64_t oddNumber = 0x9E3779B97F4A7C15;
        value_ = (value_ ^ number) * oddNumber;
        value_ ^= value_ >> 32;
    }

    std::uint64_t value_ = 1;
};

std::uint64_t nanoseconds(const timespec& time) {
    return static_cast<std::uint64_t>(time.tv_sec) * 1'000'000'000 + static_cast<std::uint64_t>(time.tv_nsec);
}

// The times of a folder change with its entries, which are the folder's own affair.
std::uint64_t signatureOf(const struct stat& status) {
    if (S_ISDIR(status.st_mode))
        return Signature(status.st_mode & S_IFMT, status.st_dev, status.st_ino).value();
    return Signature(status.st_mode, status.st_ino, status.st_size, nanoseconds(status.st_mtim),
                     nanoseconds(status.st_ctim))
        .value();
}

struct FolderLook {
    std::uint64_t signature = 0;  // 0 for an empty one
    std::vector<std::string> folders;
};

// The entries are summed up, because servers list them in any order.
void add(FolderLook& look, int folder, std::string_view name) {
    struct stat status {};
    constexpr int flags = AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT;
    if (uninterrupted([&] { return fstatat(folder, name.data(), &status, flags); }) != 0)
        return;
    look.signature += Signature(std::hash<std::string_view>()(name), signatureOf(status)).value();
    if (S_ISDIR(status.st_mode))
        look.folders.emplace_back(name);
}

FolderLook lookInto(const std::string& folder, const std::atomic<bool>& stopped) {
    auto listing = platform::FolderListing::open(folder);
    if (!listing || !listing->readToTheEnd())
        return {Signature(errno).value(), {}};
    FolderLook look;
    for (const platform::FolderItem& item : listing->items) {
        if (stopped)
            break;
        add(look, listing->folder.number(), item.name);
    }
    return look;
}

}  // namespace

std::vector<std::string> PolledTree::look(const std::atomic<bool>& stopped) {
    const bool wasAway = awaitServer();
    Appearance now = appearance(stopped);
    if (stopped || (isKnown_ && !wasAway && now == known_))
        return {};
    std::swap(known_, now);
    return std::exchange(isKnown_, true) && !wasAway ? changesSince(now) : std::vector{reported("")};
}

// What the kernel has cached would be answered without the server.
bool PolledTree::awaitServer() const {
    const auto begun = clock_();
    struct statx status {};
    statx(AT_FDCWD, place_.path.c_str(), AT_STATX_FORCE_SYNC | AT_NO_AUTOMOUNT, STATX_BASIC_STATS, &status);
    return clock_() - begun >= platform::MountReach::usualPatience;
}

PolledTree::Appearance PolledTree::appearance(const std::atomic<bool>& stopped) const {
    struct stat status {};
    if (uninterrupted([&] { return stat(place_.path.c_str(), &status); }) != 0)
        return {};
    Appearance appearance{signatureOf(status), {}};
    if (S_ISDIR(status.st_mode) && place_.depth == PolledPlace::Depth::tree)
        appearance.folders = folders(stopped);
    return appearance;
}

PolledTree::Signatures PolledTree::folders(const std::atomic<bool>& stopped) const {
    Signatures signatures;
    std::vector<std::string> open{""};
    while (!open.empty() && !stopped) {
        const std::string folder = std::move(open.back());
        open.pop_back();
        FolderLook look = lookInto(path::appending(place_.path, folder), stopped);
        signatures[folder] = look.signature;
        for (const std::string& name : look.folders) {
            std::string child = path::appending(folder, name);
            if (!isExcluded(path::appending(place_.path, child)))
                open.push_back(std::move(child));
        }
    }
    return signatures;
}

bool PolledTree::isExcluded(const std::string& path) const {
    return std::find(place_.excluded.begin(), place_.excluded.end(), path) != place_.excluded.end();
}

std::vector<std::string> PolledTree::changesSince(const Appearance& before) const {
    if (before.signature != known_.signature)
        return {reported("")};
    std::set<std::string> changes;
    for (const auto& [folder, signature] : known_.folders) {
        const auto earlier = before.folders.find(folder);
        if (signature != (earlier == before.folders.end() ? 0 : earlier->second))
            changes.insert(reported(folder));
    }
    return {changes.begin(), changes.end()};
}

std::string PolledTree::reported(const std::string& folder) const {
    if (place_.package)
        return *place_.package;
    return path::appending(place_.reportedPath, outermostPackageOrAll(folder));
}

}  // namespace vexo
