// The table behind the metadata index, in an SQLite file that several processes may have open. Knows how to
// tell a damaged file from one that is out of reach for now. Belongs to one thread at a time.
//
// Each entry carries the day on which it was last used, by which `prune` finds those that can go.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "framework/metadata/MediaProperties.h"

struct sqlite3;
struct sqlite3_stmt;

namespace vexo {

// Identifies the content of a file, without its name: a file that is moved keeps its properties, one that is
// changed loses them.
struct FileKey {
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    std::uint64_t size = 0;
    std::int64_t modificationTime = 0;  // nanoseconds from 1970

    bool operator==(const FileKey&) const = default;
};

using DayNumber = std::int64_t;  // days from 1970-01-01, UTC

// An entry takes some 280 bytes.
struct IndexLimits {
    // A disk that is brought out once a year keeps its entries; those of files that are gone go in the end.
    DayNumber unusedDays = 400;
    // About 140 MB, and far more movies than a home holds.
    int entries = 500'000;
    // A tenth of a second: whoever opens the table after a long while does not wait for all that went stale.
    int droppedAtOnce = 2'000;
};

class IndexTable {
  public:
    enum class Outcome {
        done,
        damaged,      // the file is no index, or one of a newer version
        unavailable,  // locked for long, unreadable, disk full
    };

    struct Entry {
        FileKey key;
        MediaReaderAnswer answer;
        bool isNewlyUsed = false;  // no need to note that it is used today
    };
    using Entries = std::vector<Entry>;

    // Opens the table, making it where there is none; ":memory:" makes one that lives as long as the object.
    // One of an older version is emptied. `table` is nil unless the outcome is `done`.
    static Outcome open(const std::string& path, std::unique_ptr<IndexTable>& table);
    ~IndexTable();
    IndexTable(const IndexTable&) = delete;
    IndexTable& operator=(const IndexTable&) = delete;

    // Appends the entries of a device whose inodes lie from `firstInode` to `lastInode`, by inode. Those that
    // make no sense are left out.
    [[nodiscard]] Outcome find(std::uint64_t device, std::uint64_t firstInode, std::uint64_t lastInode,
                               DayNumber today, Entries& entries);
    // An answer for an earlier state of the file is replaced.
    [[nodiscard]] Outcome store(const FileKey& key, const MediaReaderAnswer& answer, DayNumber today);

    // These two only tidy up: they do not wait for another process, but are unavailable while it writes.

    // Keys that have no entry are passed over.
    [[nodiscard]] Outcome noteUse(const std::vector<FileKey>& keys, DayNumber today);
    // Drops what is beyond the limits, the longest unused first, once a day or until all of it is gone.
    [[nodiscard]] Outcome prune(DayNumber today, const IndexLimits& limits);

    // Whether the file was deleted or renamed since it was opened, so that nobody else will see what is
    // stored.
    bool isDisplaced() const;

  private:
    struct Closer {
        void operator()(sqlite3* database) const;
        void operator()(sqlite3_stmt* statement) const;
    };
    using Statement = std::unique_ptr<sqlite3_stmt, Closer>;

    IndexTable() = default;

    int prepare(const std::string& path);
    int configure();
    int prepareStatement(const std::string& sql, Statement& statement);

    std::unique_ptr<sqlite3, Closer> database_;
    Statement find_;
    Statement store_;
    Statement use_;
};

}  // namespace vexo
