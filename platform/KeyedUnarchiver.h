// Reads keyed archives, binary or XML, object by object.
//
// Only what is asked for is decoded: reaching one entry of a large binary archive reads the few objects on
// the way to it and nothing else. An archive that is rejected raises ArchiveError, at once or when the
// damaged part is reached. A binary archive is read where it lies; an XML archive is read whole when it is
// opened.
//
// Everything an archive can declare is bounded: what one call has to read, how deep objects are made within
// one another (512 levels). The objects of an archive may refer to each other in circles.
//
// The classes decoded here are those of strings, numbers, dates, data, dictionaries, arrays, sets, URLs,
// UUIDs and null. The object number 0 of an archive stands for nil.
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

    // Human-readable: the text of a text, the elements of a collection. Long collections end in an ellipsis.
    virtual std::string description() const = 0;
    // The entry of a dictionary under a text key; nil when it has none. The first of several counts. An
    // object that is no dictionary, as any is that doesn't say otherwise, raises ArchiveError.
    virtual std::shared_ptr<const ArchivedObject> objectForKey(std::string_view key) const;

  private:
    friend class KeyedUnarchiver;
    mutable KeyedUnarchiver* unarchiver_ = nullptr;  // the one that decoded the object
};
using ArchivedObjectRef = std::shared_ptr<const ArchivedObject>;

// A class by which an object of an unknown class is decoded: its alloc and initWithCoder: in one. While it
// runs, decodeObjectForKey answers the keys of the object that it makes. Nil makes the object decode as nil.
using ArchivedClass = ArchivedObjectRef (*)(KeyedUnarchiver& coder);

class KeyedUnarchiverDelegate {
  public:
    virtual ~KeyedUnarchiverDelegate() = default;

    // unarchiver:cannotDecodeObjectOfClassName:originalClasses:
    // `originalClasses` is the archived class's list of itself and its ancestors. Nil makes decoding raise
    // ArchiveError, as having no delegate does.
    virtual ArchivedClass cannotDecodeObjectOfClassName(KeyedUnarchiver& unarchiver,
                                                        std::string_view className,
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
    // unarchiver. The same archived object decodes to the same object each time. Raises ArchiveError also for
    // an object that is needed to make itself, and once decoding is finished.
    ArchivedObjectRef decodeObjectForKey(std::string_view key);
    // No more keys will be decoded. Objects decoded so far stay usable, their entries included.
    void finishDecoding();

    // How an object says that it can't do what is asked of it: raises ArchiveError with `problem` and the
    // source's name. Within a RejectedArchivesAsUnreadable it reports the error instead and answers nil.
    ArchivedObjectRef reject(const std::string& problem);

    struct Implementation;

  private:
    std::unique_ptr<Implementation> implementation_;
};

// While one exists, archives that are rejected on its thread count as unreadable instead of raising: from the
// first error on, which `report` is told, each of their keys decodes as nil, and so does each entry of their
// objects. Constructors don't raise either. The host uses it to save the healthy rest of a library from one
// broken document.
//
// Scopes nest; the innermost gets the reports. An archive rejected within a scope stays rejected: used after
// the scope has ended, it raises the same error.
class RejectedArchivesAsUnreadable {
  public:
    using Report = void (*)(const ArchiveError& error, void* context);

    RejectedArchivesAsUnreadable(Report reporter, void* context);
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
