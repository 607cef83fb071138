#include <sys/mount.h>

#include <filesystem>
#include <optional>

#include "tests/soak/Actors.h"
#include "tests/support/LoopImage.h"

namespace soak {
namespace {

namespace fs = std::filesystem;
using testing_support::ScopedMount;

class FolderCoverer final : public Actor {
  public:
    FolderCoverer(const Places& places, unsigned seed)
        : Actor(seed), places_(places), source_(places.outside + "/Source") {}

    std::string name() const override { return "mounts"; }

    void act() override {
        static constexpr Deed<FolderCoverer> deeds[] = {
            {"bind", &FolderCoverer::bind},     {"memory", &FolderCoverer::memory},
            {"unbind", &FolderCoverer::unbind}, {"free memory", &FolderCoverer::freeMemory},
            {"write", &FolderCoverer::write},   {"make project", &FolderCoverer::makeProject},
        };
        doOneOf(*this, deeds);
    }

    void leave() override {
        event_.reset();
        project_.reset();
        unmountAll(places_.coveredEvent);
        unmountAll(places_.coveredProject);
    }

  private:
    // Also what could not be unmounted while its library was away.
    static void unmountAll(const std::string& mountPoint) {
        while (umount2(mountPoint.c_str(), MNT_DETACH) == 0) {
        }
    }
    static bool makeFolder(const std::string& path) {
        std::error_code failed;
        fs::create_directory(path, failed);
        return fs::is_directory(path, failed);
    }

    // Others may take the folders away before they are mounted on.
    template <typename Mount>
    static bool tryToMount(std::optional<ScopedMount>& mounted, const Mount& mount) {
        if (mounted)
            return false;
        try {
            mounted.emplace(mount());
            return true;
        } catch (const std::runtime_error&) {
            return false;
        }
    }
    bool bind() {
        return makeFolder(source_) && makeFolder(places_.coveredEvent) &&
               tryToMount(event_, [&] { return ScopedMount::bind(source_, places_.coveredEvent); });
    }
    bool memory() {
        return makeFolder(places_.coveredProject) &&
               tryToMount(project_, [&] { return ScopedMount::memory(places_.coveredProject); });
    }
    static bool unmount(std::optional<ScopedMount>& mounted) {
        const bool wasMounted = mounted.has_value();
        mounted.reset();
        return wasMounted;
    }
    bool unbind() { return unmount(event_); }
    bool freeMemory() { return unmount(project_); }
    bool write() { return copyOver(sampleMovie(chance), clipIn(source_, chance)); }
    bool makeProject() {
        std::error_code failed;
        const std::string project = projectIn(places_.coveredProject, chance);
        return project_ && fs::create_directories(project + "/Movies", failed) &&
               copyOver(sampleMovie(chance), project + "/Movies/0.mov");
    }

    const Places& places_;
    const std::string source_;
    std::optional<ScopedMount> event_;
    std::optional<ScopedMount> project_;
};

}  // namespace

ActorRef newFolderCoverer(const Places& places, unsigned seed) {
    return std::make_unique<FolderCoverer>(places, seed);
}

}  // namespace soak
