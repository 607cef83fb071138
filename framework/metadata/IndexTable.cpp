#include "framework/metadata/IndexTable.h"

#include <fmt/format.h>
#include <sqlite3.h>

#include "framework/metadata/AnswerColumns.h"
#include "framework/metadata/ReaderMessage.h"

namespace vexo {

namespace {

// Raised when the columns change or what answers mean does.
constexpr int tableVersion = 3;
constexpr int busyMilliseconds = 2000;
// Uses are noted this coarsely, so that a library which is looked at daily is written to once a week.
constexpr DayNumber daysOfOneNote = 7;

// Where the answer begins, behind the key and the day, in the statements that write and read entries.
constexpr int firstAnswerParameter = 6;
constexpr int firstAnswerColumn = 4;

// The index by day holds the keys as well, so pruning looks at nothing else to choose what goes.
std::string creation() {
    return fmt::format(
        "CREATE TABLE IF NOT EXISTS files ("
        " device INTEGER NOT NULL, inode INTEGER NOT NULL, size INTEGER NOT NULL, modified INTEGER NOT NULL,"
        " day INTEGER NOT NULL, {}, PRIMARY KEY (device, inode)) WITHOUT ROWID;"
        "CREATE INDEX IF NOT EXISTS filesByDay ON files (day);"
        "CREATE TABLE IF NOT EXISTS pruning (id INTEGER PRIMARY KEY, day INTEGER NOT NULL);"
        "PRAGMA user_version = {}",
        answerColumnDefinitions, tableVersion);
}
constexpr const char* removal = "DROP TABLE IF EXISTS files; DROP TABLE IF EXISTS pruning";

std::string selection() {
    return fmt::format(
        "SELECT inode, size, modified, day BETWEEN ?4 AND ?5, {} FROM files"
        " WHERE device = ?1 AND inode BETWEEN ?2 AND ?3 ORDER BY inode",
        answerColumns);
}

std::string insertion() {
    std::string parameters = "?1";
    for (int i = 2; i <= firstAnswerParameter + answerColumnCount - 1; ++i)
        parameters += fmt::format(", ?{}", i);
    return fmt::format("INSERT OR REPLACE INTO files (device, inode, size, modified, day, {}) VALUES ({})",
                       answerColumns, parameters);
}
constexpr const char* use =
    "UPDATE files SET day = ?5 WHERE device = ?1 AND inode = ?2 AND size = ?3 AND modified = ?4";

std::string pruningFor(DayNumber today, const IndexLimits& limits) {
    constexpr const char* sql =
        "DELETE FROM files WHERE (device, inode) IN ("
        " SELECT device, inode FROM files ORDER BY day LIMIT min({atOnce}, max("
        "  (SELECT COUNT(*) FROM (SELECT 1 FROM files WHERE day < {oldest} LIMIT {atOnce})),"
        "  (SELECT COUNT(*) FROM files) - {entries})));"
        "INSERT OR REPLACE INTO pruning (id, day) SELECT 1, {today}"
        " WHERE (SELECT COUNT(*) FROM files) <= {entries}"
        " AND NOT EXISTS (SELECT 1 FROM files WHERE day < {oldest})";
    return fmt::format(sql, fmt::arg("atOnce", limits.droppedAtOnce), fmt::arg("entries", limits.entries),
                       fmt::arg("oldest", today - limits.unusedDays), fmt::arg("today", today));
}

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

FileKey keyInRow(sqlite3_stmt* row, std::uint64_t device) {
    return {device, static_cast<std::uint64_t>(sqlite3_column_int64(row, 0)),
            static_cast<std::uint64_t>(sqlite3_column_int64(row, 1)), sqlite3_column_int64(row, 2)};
}

// Runs a statement that answers nothing, and makes it ready for the next time.
int run(sqlite3_stmt* statement) {
    const int result = sqlite3_step(statement);
    sqlite3_reset(statement);
    return result == SQLITE_DONE ? SQLITE_OK : result;
}

int execute(sqlite3* database, const std::string& sql) {
    return sqlite3_exec(database, sql.c_str(), nullptr, nullptr, nullptr);
}

int readNumber(sqlite3* database, const char* sql, std::int64_t& number) {
    sqlite3_stmt* statement = nullptr;
    int result = sqlite3_prepare_v2(database, sql, -1, &statement, nullptr);
    if (result == SQLITE_OK)
        result = sqlite3_step(statement);
    if (result == SQLITE_ROW)
        number = sqlite3_column_int64(statement, 0);
    sqlite3_finalize(statement);
    return result == SQLITE_ROW || result == SQLITE_DONE ? SQLITE_OK : result;
}

int readVersion(sqlite3* database, std::int64_t& version) {
    return readNumber(database, "PRAGMA user_version", version);
}

// Does all of the work or nothing, even when the process is killed over it.
template <typename Work>
int inTransaction(sqlite3* database, Work work) {
    int result = execute(database, "BEGIN IMMEDIATE");
    if (result != SQLITE_OK)
        return result;
    result = work();
    if (result == SQLITE_OK)
        result = execute(database, "COMMIT");
    if (result != SQLITE_OK)
        execute(database, "ROLLBACK");
    return result;
}

template <typename Work>
int inTransactionWithoutWaiting(sqlite3* database, Work work) {
    sqlite3_busy_timeout(database, 0);
    const int result = inTransaction(database, work);
    sqlite3_busy_timeout(database, busyMilliseconds);
    return result;
}

// Several processes may find the file empty or old at once: only the first one makes the table.
int makeTable(sqlite3* database) {
    return inTransaction(database, [database] {
        std::int64_t version = 0;
        int result = readVersion(database, version);
        if (result != SQLITE_OK || version == tableVersion)
            return result;
        if (version != 0)
            result = execute(database, removal);
        return result == SQLITE_OK ? execute(database, creation()) : result;
    });
}

}  // namespace

void IndexTable::Closer::operator()(sqlite3* database) const {
    sqlite3_close(database);
}

void IndexTable::Closer::operator()(sqlite3_stmt* statement) const {
    sqlite3_finalize(statement);
}

IndexTable::Outcome IndexTable::open(const std::string& path, std::unique_ptr<IndexTable>& table) {
    std::unique_ptr<IndexTable> opened(new IndexTable);
    const Outcome outcome = outcomeOf(opened->prepare(path));
    table = outcome == Outcome::done ? std::move(opened) : nullptr;
    return outcome;
}

IndexTable::~IndexTable() = default;

int IndexTable::prepare(const std::string& path) {
    constexpr int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_NOMUTEX;
    sqlite3* database = nullptr;
    int result = sqlite3_open_v2(path.c_str(), &database, flags, nullptr);
    database_.reset(database);
    if (result == SQLITE_OK)
        result = configure();
    if (result == SQLITE_OK)
        result = prepareStatement(selection(), find_);
    if (result == SQLITE_OK)
        result = prepareStatement(insertion(), store_);
    if (result == SQLITE_OK)
        result = prepareStatement(use, use_);
    return result;
}

int IndexTable::configure() {
    sqlite3* const database = database_.get();
    sqlite3_busy_timeout(database, busyMilliseconds);
    sqlite3_limit(database, SQLITE_LIMIT_LENGTH, 4 * static_cast<int>(maximumMessageBytes));
    std::int64_t version = 0;
    const int result = readVersion(database, version);
    if (result != SQLITE_OK)
        return result;
    if (version < 0 || version > tableVersion)
        return SQLITE_NOTADB;
    // Some builds of SQLite overwrite what is dropped; here that would cost seconds and protect nothing.
    execute(database, "PRAGMA secure_delete = OFF");
    // Not every file system can share memory and another process may be changing the mode; the index works in
    // SQLite's own mode as well.
    execute(database, "PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL");
    return version == tableVersion ? SQLITE_OK : makeTable(database);
}

int IndexTable::prepareStatement(const std::string& sql, Statement& statement) {
    sqlite3_stmt* prepared = nullptr;
    const int result =
        sqlite3_prepare_v3(database_.get(), sql.c_str(), -1, SQLITE_PREPARE_PERSISTENT, &prepared, nullptr);
    statement.reset(prepared);
    return result;
}

IndexTable::Outcome IndexTable::find(std::uint64_t device, std::uint64_t firstInode, std::uint64_t lastInode,
                                     DayNumber today, Entries& entries) {
    sqlite3_stmt* const row = find_.get();
    sqlite3_bind_int64(row, 1, bits(device));
    sqlite3_bind_int64(row, 2, bits(firstInode));
    sqlite3_bind_int64(row, 3, bits(lastInode));
    sqlite3_bind_int64(row, 4, today - daysOfOneNote + 1);
    sqlite3_bind_int64(row, 5, today);
    int result = sqlite3_step(row);
    for (; result == SQLITE_ROW; result = sqlite3_step(row)) {
        if (auto answer = answerInRow(row, firstAnswerColumn))
            entries.push_back({keyInRow(row, device), *std::move(answer), sqlite3_column_int(row, 3) != 0});
    }
    sqlite3_reset(row);
    return outcomeOf(result);
}

IndexTable::Outcome IndexTable::store(const FileKey& key, const MediaReaderAnswer& answer, DayNumber today) {
    bindKey(store_.get(), key);
    sqlite3_bind_int64(store_.get(), 5, today);
    bindAnswer(store_.get(), firstAnswerParameter, answer);
    const int result = run(store_.get());
    sqlite3_clear_bindings(store_.get());
    return outcomeOf(result);
}

IndexTable::Outcome IndexTable::noteUse(const std::vector<FileKey>& keys, DayNumber today) {
    return outcomeOf(inTransactionWithoutWaiting(database_.get(), [&] {
        int result = SQLITE_OK;
        for (auto key = keys.begin(); key != keys.end() && result == SQLITE_OK; ++key) {
            bindKey(use_.get(), *key);
            sqlite3_bind_int64(use_.get(), 5, today);
            result = run(use_.get());
        }
        return result;
    }));
}

IndexTable::Outcome IndexTable::prune(DayNumber today, const IndexLimits& limits) {
    // The last day may be in the future, noted when the clock was wrong; it is not today all the same.
    std::int64_t last = today - 1;
    const int result = readNumber(database_.get(), "SELECT day FROM pruning", last);
    if (result != SQLITE_OK || last == today)
        return outcomeOf(result);
    return outcomeOf(inTransactionWithoutWaiting(
        database_.get(), [&] { return execute(database_.get(), pruningFor(today, limits)); }));
}

bool IndexTable::isDisplaced() const {
    int moved = 0;
    sqlite3_file_control(database_.get(), "main", SQLITE_FCNTL_HAS_MOVED, &moved);
    return moved != 0;
}

}  // namespace vexo
