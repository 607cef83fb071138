// Reads keyed archives, binary or XML, object by object.
//
// Only what is asked for is decoded: reaching one entry of a large binary archive reads the few objects on
// the way to it and nothing else. An archive that is rejected raises ArchiveError, at once or when the damaged
// part is reached.
//
// An unarchiver and its objects belong to one thread.
#pragma once

#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include "platform/ByteSource.h"

namespace platform {

class KeyedUnarchiver;

// Raised for bytes that are no keyed archive, or one that is damaged, or an object that cannot do what is
// asked of it. The text names the source.
class ArchiveError : public std::runtime_error {
  public:
    ArchiveError(std::string sourceName, const std::string& problem)
        : std::runtime_error(sourceName.empty() ? problem : sourceName + ": " + problem),
          sourceName_(std::move(sourceName)) {}
    const std::string& sourceName() const { return sourceName_; }

  private:
    std::string sourceName_;
};

// The root of classes that can be decoded from an archive.
class ArchivedObject {
  public:
    virtual ~ArchivedObject() = default;

    // Human-readable, as the platform prints an object.
    virtual std::string description() const = 0;
    // The entry of a dictionary under a text key; nil when it has none. Raises ArchiveError when the object is
    // no dictionary.
    virtual std::shared_ptr<const ArchivedObject> objectForKey(std::string_view key) const = 0;
};
using ArchivedObjectRef = std::shared_ptr<const ArchivedObject>;

// A class by which an object of an unknown class is decoded: its alloc and initWithCoder: in one.
using ArchivedClass = ArchivedObjectRef (*)(KeyedUnarchiver& coder);

class KeyedUnarchiverDelegate {
  public:
    virtual ~KeyedUnarchiverDelegate() = default;

    // unarchiver:cannotDecodeObjectOfClassName:originalClasses:
    // `originalClasses` is the archived class's list of itself and its ancestors. Nil makes decoding raise.
    virtual ArchivedClass cannotDecodeObjectOfClassName(KeyedUnarchiver& unarchiver, std::string_view className,
                                                        const std::vector<std::string>& originalClasses) = 0;
};

class KeyedUnarchiver {
  public:
    // Opens an archive over `bytes`. `delegate` is not owned and may be nil. Raises ArchiveError for bytes
    // that are no keyed archive.
    KeyedUnarchiver(std::unique_ptr<ByteSource> bytes, KeyedUnarchiverDelegate* delegate);
    ~KeyedUnarchiver();
    KeyedUnarchiver(const KeyedUnarchiver&) = delete;
    KeyedUnarchiver& operator=(const KeyedUnarchiver&) = delete;

    // The top-level object under `key`; nil when the archive has none. Objects may not outlive the
    // unarchiver. The same archived object decodes to the same object each time.
    ArchivedObjectRef decodeObjectForKey(std::string_view key);
    void finishDecoding();

    struct Implementation;

  private:
    std::unique_ptr<Implementation> implementation_;
};

// While one exists, archives that are rejected on its thread count as unreadable instead of raising: every
// key of theirs decodes as nil, and `report` is told each error. The host uses it to save the healthy rest
// of a library from one broken document.
class RejectedArchivesAsUnreadable {
  public:
    using Report = void (*)(const ArchiveError& error, void* context);

    RejectedArchivesAsUnreadable(Report report, void* context);
    ~RejectedArchivesAsUnreadable();
    RejectedArchivesAsUnreadable(const RejectedArchivesAsUnreadable&) = delete;
    RejectedArchivesAsUnreadable& operator=(const RejectedArchivesAsUnreadable&) = delete;

    // The innermost one of this thread, or nil.
    static RejectedArchivesAsUnreadable* current();
    void report(const ArchiveError& error) const { report_(error, context_); }

  private:
    const Report report_;
    void* const context_;
    RejectedArchivesAsUnreadable* const enclosing_;
};

}  // namespace platform
