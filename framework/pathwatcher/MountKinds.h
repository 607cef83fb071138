// Which folders lie on file systems whose changes the kernel doesn't report.
//
// Told by the text of the mount table alone: a look at a mount whose server is gone would wait for the
// server. Immutable.
#pragma once

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "platform/linux/MountRules.h"

namespace vexo {

enum class ChangeSource {
    events,
    polling,  // other machines and programs change the files behind the kernel's back
    nothing,  // the kernel's own, such as /proc, and what an automounter has not mounted yet
};

struct SilentMount {
    std::string path;  // of the mount point
    ChangeSource source = ChangeSource::polling;
    std::string fileSystem;  // "nfs4"
    bool isNetwork = false;
};

class MountKinds {
  public:
    MountKinds() = default;
    explicit MountKinds(const std::vector<platform::MountEntry>& table);

    // The mount at exactly this path, when it reports no changes; else nil. The path holds no links.
    const SilentMount* silentMountAt(std::string_view path) const;
    // Such mounts below the path.
    std::vector<const SilentMount*> silentMountsBelow(std::string_view path) const;
    // The mount point of what lies at the path.
    std::string mountPointOf(std::string_view path) const;

    // Mount points that lead elsewhere in the other table, or to nothing.
    std::vector<std::string> differences(const MountKinds& other) const;

  private:
    struct TextHash {
        using is_transparent = void;
        std::size_t operator()(std::string_view text) const { return std::hash<std::string_view>()(text); }
    };
    template <typename Value>
    using ByPath = std::unordered_map<std::string, Value, TextHash, std::equal_to<>>;

    ByPath<std::string> descriptions_;  // of every mount, by its mount point
    ByPath<SilentMount> silent_;
};

}  // namespace vexo
