// Remembers what media files said, failures included, so that each is read once for as long as it stays the
// same. Kept in a file that the user's processes share; losing it costs nothing but time.
//
// A file that is damaged or of a newer version is set aside (".set-aside" is appended to its name) and a new
// one begun; one of an older version is emptied. Where the folder can't be written, the index lives in
// memory. Nothing here fails: what cannot be remembered is read again. Callable from any thread.
//
// Opening the file drops entries that were not used for long and those beyond a number of them (IndexLimits).
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "framework/metadata/IndexTable.h"
#include "framework/metadata/MediaProperties.h"
#include "framework/metadata/ReadAhead.h"
#include "platform/ThreadSafety.h"

namespace vexo {

// Answers today's number. Callable from any thread.
using DayClock = std::function<DayNumber()>;

DayNumber systemDay();

class MetadataIndex {
  public:
    // Opens the file, making it and its folder (for the user alone) as needed. nil for one in memory.
    explicit MetadataIndex(const std::optional<std::string>& path, DayClock today = systemDay);
    ~MetadataIndex();

    // "metadata.sqlite" in the user's cache folder for vexo; nil when there is neither XDG_CACHE_HOME nor
    // HOME.
    static std::optional<std::string> defaultPath();

    // The file in use; empty while the index lives in memory.
    std::string path() const VX_EXCLUDES(mutex_);

    std::optional<MediaReaderAnswer> find(const FileKey& key) VX_EXCLUDES(mutex_);
    // Failures that do not lie in the file are not kept.
    void store(const FileKey& key, const MediaReaderAnswer& answer) VX_EXCLUDES(mutex_);

  private:
    void openFile() VX_REQUIRES(mutex_);
    void openMemory() VX_REQUIRES(mutex_);
    // Like IndexTable::open, and drops what can go.
    IndexTable::Outcome openTidied() VX_REQUIRES(mutex_);
    IndexTable::Outcome replaceFile() VX_REQUIRES(mutex_);
    // Begins anew when an operation found the file damaged.
    void recoverFrom(IndexTable::Outcome outcome) VX_REQUIRES(mutex_);
    // Follows the path when somebody deleted or replaced the file.
    void reopenIfDisplaced() VX_REQUIRES(mutex_);
    // Reads the entries of the files that were made shortly before and after this one.
    void readAround(const FileKey& key) VX_REQUIRES(mutex_);
    void noteUse(const FileKey& key) VX_REQUIRES(mutex_);
    void writeUses() VX_REQUIRES(mutex_);

    const DayClock today_;

    mutable platform::Mutex mutex_;
    std::string path_ VX_GUARDED_BY(mutex_);
    std::unique_ptr<IndexTable> table_ VX_GUARDED_BY(mutex_);  // nil only when memory is short
    ReadAhead readAhead_ VX_GUARDED_BY(mutex_);
    // Found, but not yet noted as used. Losing them makes entries look older, no more.
    std::vector<FileKey> used_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
