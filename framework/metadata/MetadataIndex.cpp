#include "framework/metadata/MetadataIndex.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <utility>

#include "platform/Path.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/UserFolders.h"

namespace vexo {

namespace {

using Outcome = IndexTable::Outcome;

// Some milliseconds of writing at a time.
constexpr std::size_t usesInOneTransaction = 512;

void makeFolderForUserAlone(const std::string& folder) {
    std::error_code ignored;
    std::filesystem::create_directories(platform::path::withoutLastComponent(folder), ignored);
    mkdir(folder.c_str(), 0700);
}

// Renames the database together with the journals that belong to it: apart they would spoil each other.
void setAside(const std::string& path) {
    for (const char* part : {"", "-wal", "-shm"}) {
        const std::string aside = path + ".set-aside" + part;
        std::remove(aside.c_str());
        std::rename((path + part).c_str(), aside.c_str());
    }
}

// The right to replace the database; at most one process has it. Does not wait.
platform::FileDescriptor lockForReplacing(const std::string& path) {
    platform::FileDescriptor lock(
        open((path + ".lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
    if (lock && flock(lock.number(), LOCK_EX | LOCK_NB) != 0)
        return {};
    return lock;
}

// False while another process is at it. Does not touch the path's file when it isn't the table's any more.
bool setAsideUnderLock(const std::string& path, const IndexTable& table) {
    const platform::FileDescriptor lock = lockForReplacing(path);
    if (lock && !table.isDisplaced())
        setAside(path);
    return static_cast<bool>(lock);
}

}  // namespace

DayNumber systemDay() {
    const auto now = std::chrono::system_clock::now().time_since_epoch();
    return std::chrono::floor<std::chrono::days>(now).count();
}

MetadataIndex::MetadataIndex(const std::optional<std::string>& path, DayClock today)
    : today_(std::move(today)), path_(path.value_or("")) {
    platform::Locked lock(mutex_);
    if (path_.empty())
        openMemory();
    else
        openFile();
}

MetadataIndex::~MetadataIndex() {
    platform::Locked lock(mutex_);
    writeUses();
}

std::optional<std::string> MetadataIndex::defaultPath() {
    if (const auto cache = platform::userCacheFolder())
        return platform::path::appending(*cache, "vexo/metadata.sqlite");
    return std::nullopt;
}

std::string MetadataIndex::path() const {
    platform::Locked lock(mutex_);
    return path_;
}

void MetadataIndex::openFile() {
    makeFolderForUserAlone(platform::path::withoutLastComponent(path_));
    Outcome outcome = openTidied();
    if (outcome == Outcome::damaged)
        outcome = replaceFile();
    if (outcome != Outcome::done)
        openMemory();
}

void MetadataIndex::openMemory() {
    path_.clear();
    IndexTable::open(":memory:", table_);
}

Outcome MetadataIndex::openTidied() {
    const Outcome outcome = IndexTable::open(path_, table_);
    if (outcome != Outcome::done || table_->prune(today_(), IndexLimits()) != Outcome::damaged)
        return outcome;
    table_.reset();
    return Outcome::damaged;
}

Outcome MetadataIndex::replaceFile() {
    const platform::FileDescriptor lock = lockForReplacing(path_);
    if (!lock)
        return Outcome::unavailable;
    // Another process may have replaced it since.
    const Outcome outcome = openTidied();
    if (outcome != Outcome::damaged)
        return outcome;
    setAside(path_);
    return openTidied();
}

void MetadataIndex::recoverFrom(Outcome outcome) {
    if (outcome != Outcome::damaged)
        return;
    const bool isReplaceable = !path_.empty() && setAsideUnderLock(path_, *table_);
    table_.reset();
    if (isReplaceable)
        openFile();
    else
        openMemory();
}

void MetadataIndex::reopenIfDisplaced() {
    if (path_.empty() || !table_->isDisplaced())
        return;
    table_.reset();
    openFile();
}

void MetadataIndex::noteUse(const FileKey& key) {
    used_.push_back(key);
    if (used_.size() >= usesInOneTransaction)
        writeUses();
}

void MetadataIndex::writeUses() {
    if (!used_.empty() && table_)
        recoverFrom(table_->noteUse(used_, today_()));
    used_.clear();
}

std::optional<MediaReaderAnswer> MetadataIndex::find(const FileKey& key) {
    platform::Locked lock(mutex_);
    if (!table_)
        return std::nullopt;
    IndexTable::Entry* entry = readAhead_.find(key);
    if (!entry) {
        readAround(key);
        entry = readAhead_.find(key);
    }
    if (!entry)
        return std::nullopt;
    if (!std::exchange(entry->isNewlyUsed, true))
        noteUse(key);
    return entry->answer;
}

void MetadataIndex::readAround(const FileKey& key) {
    IndexTable::Entries entries;
    const auto [first, last] = ReadAhead::inodesAround(key);
    const Outcome outcome = table_->find(key.device, first, last, today_(), entries);
    if (outcome == Outcome::done)
        readAhead_.put(key, std::move(entries));
    else
        recoverFrom(outcome);
}

void MetadataIndex::store(const FileKey& key, const MediaReaderAnswer& answer) {
    const auto* failure = std::get_if<MediaFailure>(&answer);
    if (failure && failure->cause != FailureCause::file)
        return;
    platform::Locked lock(mutex_);
    if (table_)
        reopenIfDisplaced();
    readAhead_.drop(key);
    if (table_)
        recoverFrom(table_->store(key, answer, today_()));
}

}  // namespace vexo
