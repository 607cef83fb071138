// All folders below one, each of them watched for itself: inotify doesn't look below a folder.
//
// A folder is watched first and listed then, so what is made in it meanwhile is either listed or an event, or
// both, which does no harm. What an event says about an entry is not believed, because it may be outdated:
// the entry is looked at again. So after the last event of a row the tree is right whatever their order was.
//
// Links are not entered. Not thread-safe.
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "framework/pathwatcher/PolledSubtree.h"
#include "framework/pathwatcher/WatchMeans.h"

namespace vexo {

class FolderTree {
  public:
    class Owner {
      public:
        // The top folder was moved or removed, or its file system unmounted.
        virtual void treeWasLost(bool unmounted) = 0;

      protected:
        ~Owner() = default;
    };

    // `path` is free of links; reports name what is in the tree by `reportedPath` instead. The means and the
    // owner must outlive the tree. Watches nothing yet.
    FolderTree(WatchMeans& means, Owner& owner, std::string path, std::string reportedPath);
    ~FolderTree();
    FolderTree(const FolderTree&) = delete;
    FolderTree& operator=(const FolderTree&) = delete;

    const std::string& path() const { return path_; }

    // Watches and lists everything. Answers errno when the top folder can't be watched, else 0.
    int watch();
    // Whether the path still leads to the folder that is watched as the top.
    bool isInPlace();

    // Something was mounted or unmounted at a path in the tree.
    void mountsChangedAt(const std::string& path);
    // Takes a report when it is about this tree; answers whether it was.
    bool take(const PollReport& report);

    // Why what is at a path in the tree is polled; nil when it isn't.
    std::optional<std::string> whyPolled(const std::string& pathInTree) const;
    // Why some folder in the tree is polled; nil when none is.
    std::optional<std::string> whyPartlyPolled() const;
    // The paths, as reported, of the folders that are watched through events.
    std::vector<std::string> watchedFolders() const;

  private:
    class Folder;
    enum class Discovery { initial, appeared };
    // What becomes of a known folder when the same is found again.
    enum class Known { isKept, isOutdated };

    void heard(Folder& folder, const FileEvent& event);
    void heardOfItself(Folder& folder, const FileEvent& event);
    void heardOfContent(Folder& folder, const FileEvent& event);
    bool isContentKnown(const Folder& folder, std::string_view name);
    void lost(Folder& folder, bool unmounted);

    void examine(Folder& parent, const std::string& name, Known whatIsKnown = Known::isKept);
    void add(std::unique_ptr<Folder> folder, Discovery discovery);
    void explore(Folder& folder, Discovery discovery);
    void discover(Folder& parent, const std::string& name, std::vector<Folder*>& discovered);
    int follow(Folder& folder);
    void poll(Folder& folder);
    void retry(Folder& folder);
    void pollInstead(Folder& folder, int error);
    static void forget(std::unique_ptr<Folder> folder);

    void markChanged(Folder& folder);
    std::string whyPolled(const Folder& folder) const;
    // The path of the folder, or of an entry in it, where the tree is at `base`.
    std::string pathBelow(const std::string& base, const Folder& folder, std::string_view entry = {}) const;
    Folder& deepestKnown(const std::string& path, bool& isExact) const;
    template <typename Visit>
    void visitAll(Visit visit) const;

    // A file whose content changed in a burst.
    struct Content {
        const Folder* folder = nullptr;  // forgotten whenever a folder may have gone
        std::string name;
        std::uint64_t burst = 0;
    };

    WatchMeans& means_;
    Owner& owner_;
    const std::string path_;
    const std::string reportedPath_;
    std::unordered_map<std::uint64_t, Folder*> polledFolders_;  // by place
    std::unique_ptr<Folder> top_;
    Content latestContent_;
};

}  // namespace vexo
