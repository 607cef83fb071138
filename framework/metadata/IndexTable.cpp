#include "framework/metadata/IndexTable.h"

#include <sqlite3.h>

#include "framework/metadata/ReaderMessage.h"

namespace vexo {

namespace {

// Raised when the columns change or what answers mean does.
constexpr int tableVersion = 1;
constexpr int busyMilliseconds = 2000;

// Several processes may find the file empty at once: only the first one makes the table.
constexpr const char* creation =
    "BEGIN IMMEDIATE;"
    "CREATE TABLE IF NOT EXISTS files ("
    " device INTEGER NOT NULL, inode INTEGER NOT NULL, size INTEGER NOT NULL, modified INTEGER NOT NULL,"
    " answer TEXT NOT NULL, PRIMARY KEY (device, inode)) WITHOUT ROWID;"
    "PRAGMA user_version = 1;"  // tableVersion
    "COMMIT";
constexpr const char* selection =
    "SELECT answer FROM files WHERE device = ?1 AND inode = ?2 AND size = ?3 AND modified = ?4";
constexpr const char* insertion =
    "INSERT OR REPLACE INTO files (device, inode, size, modified, answer) VALUES (?1, ?2, ?3, ?4, ?5)";

IndexTable::Outcome outcomeOf(int result) {
    switch (result & 0xff) {
        case SQLITE_OK:
        case SQLITE_ROW:
        case SQLITE_DONE:
            return IndexTable::Outcome::done;
        case SQLITE_CORRUPT:
        case SQLITE_NOTADB:
        case SQLITE_ERROR:  // the table lacks a column
        case SQLITE_MISMATCH:
        case SQLITE_CONSTRAINT:
        case SQLITE_TOOBIG:
            return IndexTable::Outcome::damaged;
        default:
            return IndexTable::Outcome::unavailable;
    }
}

// SQLite's integers are signed; the bits are what counts.
sqlite3_int64 bits(std::uint64_t number) {
    return static_cast<sqlite3_int64>(number);
}

void bindKey(sqlite3_stmt* statement, const FileKey& key) {
    sqlite3_bind_int64(statement, 1, bits(key.device));
    sqlite3_bind_int64(statement, 2, bits(key.inode));
    sqlite3_bind_int64(statement, 3, bits(key.size));
    sqlite3_bind_int64(statement, 4, key.modificationTime);
}

std::string textOf(sqlite3_stmt* statement) {
    const auto* bytes = static_cast<const char*>(sqlite3_column_blob(statement, 0));
    return std::string(bytes ? bytes : "", static_cast<std::size_t>(sqlite3_column_bytes(statement, 0)));
}

int prepareStatement(sqlite3* database, const char* sql, sqlite3_stmt*& statement) {
    return sqlite3_prepare_v3(database, sql, -1, SQLITE_PREPARE_PERSISTENT, &statement, nullptr);
}

}  // namespace

IndexTable::Outcome IndexTable::open(const std::string& path, std::unique_ptr<IndexTable>& table) {
    std::unique_ptr<IndexTable> opened(new IndexTable);
    const Outcome outcome = outcomeOf(opened->prepare(path));
    table = outcome == Outcome::done ? std::move(opened) : nullptr;
    return outcome;
}

IndexTable::~IndexTable() {
    sqlite3_finalize(find_);
    sqlite3_finalize(store_);
    sqlite3_close(database_);
}

int IndexTable::prepare(const std::string& path) {
    constexpr int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_NOMUTEX;
    int result = sqlite3_open_v2(path.c_str(), &database_, flags, nullptr);
    if (result == SQLITE_OK)
        result = configure();
    if (result == SQLITE_OK)
        result = prepareStatement(database_, selection, find_);
    if (result == SQLITE_OK)
        result = prepareStatement(database_, insertion, store_);
    return result;
}

int IndexTable::configure() {
    sqlite3_busy_timeout(database_, busyMilliseconds);
    sqlite3_limit(database_, SQLITE_LIMIT_LENGTH, 4 * static_cast<int>(maximumMessageBytes));
    int version = 0;
    int result = checkVersion(version);
    if (result != SQLITE_OK)
        return result;
    if (version != 0 && version != tableVersion)
        return SQLITE_NOTADB;
    // Not every file system can share memory and another process may be changing the mode; the index works in
    // SQLite's own mode as well.
    sqlite3_exec(database_, "PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL", nullptr, nullptr,
                 nullptr);
    return version == 0 ? createTable() : SQLITE_OK;
}

int IndexTable::checkVersion(int& version) {
    sqlite3_stmt* statement = nullptr;
    int result = prepareStatement(database_, "PRAGMA user_version", statement);
    if (result == SQLITE_OK) {
        result = sqlite3_step(statement);
        version = sqlite3_column_int(statement, 0);
    }
    sqlite3_finalize(statement);
    return result == SQLITE_ROW ? SQLITE_OK : result;
}

int IndexTable::createTable() {
    return sqlite3_exec(database_, creation, nullptr, nullptr, nullptr);
}

IndexTable::Outcome IndexTable::find(const FileKey& key, std::string& answer) {
    bindKey(find_, key);
    const int result = sqlite3_step(find_);
    if (result == SQLITE_ROW)
        answer = textOf(find_);
    sqlite3_reset(find_);
    return result == SQLITE_DONE ? Outcome::missing : outcomeOf(result);
}

IndexTable::Outcome IndexTable::store(const FileKey& key, const std::string& answer) {
    bindKey(store_, key);
    sqlite3_bind_text(store_, 5, answer.data(), static_cast<int>(answer.size()), SQLITE_STATIC);
    const int result = sqlite3_step(store_);
    sqlite3_reset(store_);
    sqlite3_clear_bindings(store_);
    return outcomeOf(result);
}

}  // namespace vexo
