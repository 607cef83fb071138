// A file system in memory that sends events as Linux does: for each folder that is watched, in order, named
// by the entry. Folders keep their identity when they are moved, and a watch stays with its folder.
//
// What the kernel may do to a watcher at any moment, a test does on purpose: changes between two calls of the
// watcher, a queue that runs over, a limit of watches.
#pragma once

#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "framework/pathwatcher/FileEvents.h"
#include "framework/pathwatcher/FolderAccess.h"
#include "tests/pathwatcher/ExpectedReports.h"

namespace testing_support {

class FakeDisk {
  public:
    FakeDisk();

    // Each answers whether it was possible.
    bool makeFolder(const std::string& path);
    bool makeFile(const std::string& path);
    bool write(const std::string& path);
    bool changeAttributes(const std::string& path);
    bool remove(const std::string& path);  // a folder must be empty
    void removeWithAllInIt(const std::string& path);
    bool rename(const std::string& from, const std::string& to);

    // The folder goes with all in it, as the file system that it stands for.
    void unmount(const std::string& path);

    // 0 for what is missing.
    std::uint64_t identityOf(const std::string& path) const;
    Picture picture(const std::string& folder) const;

    // Called after each look that a watcher takes and each folder that it adds.
    std::function<void()> afterLook = [] {};

    // errno for folders that are added beyond the limit, or for any folder by its path.
    std::size_t watchLimit = SIZE_MAX;
    std::map<std::string, int> failures;
    std::map<std::string, int> listingFailures;
    // Events beyond this many that wait are lost.
    std::size_t queueLimit = SIZE_MAX;

    // What a watcher watches the disk with. The disk must outlive them.
    std::unique_ptr<vexo::FileEvents> events();
    std::unique_ptr<vexo::FolderAccess> access();
    std::size_t watchCount() const { return watches_.size(); }
    std::size_t queueLength() const { return queue_.size(); }

  private:
    class Events;
    class Access;
    struct Node {
        bool isFolder = false;
        std::uint64_t number = 0;
        std::uint64_t version = 0;
        std::map<std::string, std::shared_ptr<Node>> entries;
    };
    using NodeRef = std::shared_ptr<Node>;
    struct Watch {
        std::weak_ptr<Node> folder;
        std::uint32_t kinds;
    };
    struct QueuedEvent {
        int watch;
        std::uint32_t kinds;
        std::string name;
    };

    NodeRef find(const std::string& path) const;
    NodeRef parentOf(const std::string& path) const;
    bool make(const std::string& path, bool isFolder);
    void send(const NodeRef& folder, std::uint32_t kinds, const std::string& name);
    void enqueue(int watch, std::uint32_t kinds, const std::string& name);
    void destroy(const NodeRef& node);
    void dropWatches(const NodeRef& node, std::uint32_t lastKinds);
    static void draw(Picture& picture, const Node& folder, const std::string& path);

    NodeRef root_;
    std::uint64_t lastNumber_ = 1;
    std::map<int, Watch> watches_;
    int lastWatch_ = 0;
    std::deque<QueuedEvent> queue_;
};

}  // namespace testing_support
