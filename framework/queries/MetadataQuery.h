// A query with the folders that it is asked of, and its results: the items below the folders that it means
// (ScopeWalk says what the items are).
//
// The list of folders is shared, so a folder that is added to it counts at the next update. Folders may be
// missing, lie in one another, and be named under /Volumes; results and changes have real paths.
//
// Thread-safe. One gathering or update runs at a time; others wait for it.
#pragma once

#include <atomic>
#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "framework/MetadataProvider.h"
#include "framework/queries/QueryExpression.h"
#include "host/VXPathList.h"
#include "platform/ThreadSafety.h"

namespace vexo {

// What an update found, sorted.
struct QueryChange {
    std::vector<std::string> added;
    std::vector<std::string> changed;  // results before and after
    std::vector<std::string> removed;

    bool isEmpty() const { return added.empty() && changed.empty() && removed.empty(); }
    bool operator==(const QueryChange&) const = default;
};

class MetadataQuery {
  public:
    // `scope` may be nil; `metadata` outlives the query.
    MetadataQuery(QueryExpression expression, VXPathListRef scope, const MetadataProvider& metadata);

    // Counts from the next update on.
    void setScope(VXPathListRef scope) VX_EXCLUDES(mutex_);
    VXPathListRef scope() const VX_EXCLUDES(mutex_);

    // Looks at everything; answers false when it was cancelled before it had.
    bool gather(const platform::Date& now) VX_EXCLUDES(working_, mutex_);

    // Looks at what may have changed: at and below the paths, which may be those of files, of folders, and of
    // what is no more; and at what folders the list has more or fewer than before.
    //
    // A result counts as changed when it is another file, or has another size or modification time, and when
    // it is among the paths, or is a package that one of them lies in.
    //
    // Times that move with the clock are those of `now`, but nothing is looked at because time passes.
    QueryChange update(const std::vector<std::string>& changedPaths, const platform::Date& now)
        VX_EXCLUDES(working_, mutex_);

    // Sorted by their bytes.
    std::vector<std::string> results() const VX_EXCLUDES(mutex_);

    // Ends what runs, before its next item, and all that is asked for later. The results stay as they are.
    void cancel() { cancelled_ = true; }

  private:
    using Paths = std::set<std::string>;

    // What tells whether a file is still the same.
    struct FileState {
        std::uint64_t device;
        std::uint64_t inode;
        std::int64_t size;  // bytes
        std::int64_t seconds;
        std::int64_t nanoseconds;
        bool operator==(const FileState&) const = default;
    };
    using Results = std::map<std::string, FileState>;

    Results currentResults() const VX_EXCLUDES(mutex_);
    Paths scopeFolders() const VX_EXCLUDES(mutex_);
    void lookAgain(const std::string& path, const Paths& folders, const platform::Date& now,
                   Results& results) const;
    void lookAtTree(const std::string& path, const platform::Date& now, Results& results) const;
    void lookAt(const std::string& path, const platform::Date& now, Results& results) const;
    static Paths affectedPaths(const std::vector<std::string>& changedPaths, const Paths& folders);
    static std::optional<FileState> stateOf(const std::string& path);
    static QueryChange difference(const Results& before, const Results& after, const Paths& touched);

    const QueryExpression expression_;
    const MetadataProvider& metadata_;
    std::atomic<bool> cancelled_ = false;

    // Held while files are looked at, on purpose: the next update builds on what this one finds.
    platform::Mutex working_;
    Paths knownFolders_ VX_GUARDED_BY(working_);

    mutable platform::Mutex mutex_;
    VXPathListRef scope_ VX_GUARDED_BY(mutex_);
    Results results_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
