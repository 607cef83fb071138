// The table behind the metadata index, in an SQLite file that several processes may have open. Knows how to
// tell a damaged file from one that is out of reach for now. Belongs to one thread at a time.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

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

class IndexTable {
  public:
    enum class Outcome {
        done,
        missing,      // there is no such entry
        damaged,      // the file is no index, or one of another version
        unavailable,  // locked for long, unreadable, disk full
    };

    // Opens the table, making it where there is none; ":memory:" makes one that lives as long as the object.
    // `table` is nil unless the outcome is `done`.
    static Outcome open(const std::string& path, std::unique_ptr<IndexTable>& table);
    ~IndexTable();
    IndexTable(const IndexTable&) = delete;
    IndexTable& operator=(const IndexTable&) = delete;

    // `answer` is set when the outcome is `done`.
    [[nodiscard]] Outcome find(const FileKey& key, std::string& answer);
    // An answer for an earlier state of the file is replaced.
    [[nodiscard]] Outcome store(const FileKey& key, const std::string& answer);

  private:
    IndexTable() = default;

    int prepare(const std::string& path);
    int configure();
    int createTable();
    int checkVersion(int& version);

    sqlite3* database_ = nullptr;
    sqlite3_stmt* find_ = nullptr;
    sqlite3_stmt* store_ = nullptr;
};

}  // namespace vexo
