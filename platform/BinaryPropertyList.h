// Reads binary property lists object by object, from a source that may be damaged or made to do harm.
//
// Opening reads the trailer; each question reads what it needs to be answered. What is wrong with the bytes
// raises PropertyListError when it is reached; PropertyList.h and KeyedUnarchiver.h turn it into what their
// callers know. Nothing here recurses, and nothing allocates more than `largestText` bytes.
//
// Objects name each other by number and may do so in circles and many times over: whoever follows them has to
// bound the walk, with a depth of his own and with `allowVisits`. Not thread-safe.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "platform/ByteSource.h"
#include "platform/PropertyListError.h"
#include "platform/Value.h"

namespace platform {

class BinaryPropertyList {
  public:
    static constexpr std::string_view signature = "bplist00";
    // The most bytes that one text or one piece of data may have, 256 MiB.
    static constexpr std::uint64_t largestText = std::uint64_t{1} << 28;

    enum class Kind { null, boolean, integer, real, date, data, text, uid, array, dictionary };

    // Where an object lies and what it is, as its first bytes tell. Sets are arrays here.
    struct Object {
        Kind kind = Kind::null;
        // Bytes of each unit: a number's size, 1 or 2 for text, the size of a reference for containers.
        std::size_t width = 0;
        // Units of text and data, elements of an array, entries of a dictionary; the truth of a boolean.
        std::uint64_t count = 0;
        // Where the content begins.
        std::uint64_t offset = 0;
    };

    // `source` is not owned.
    explicit BinaryPropertyList(ByteSource& source);

    // From now on at most `count` objects may be reached; one more raises. Without a call there is no bound.
    void allowVisits(std::uint64_t count) { visitsLeft_ = count; }

    Object top() { return object(topObject_); }

    // Requires of each: the object is of the kind asked for, the index below its count.
    Object element(const Object& array, std::uint64_t index);
    Object key(const Object& dictionary, std::uint64_t index);
    Object value(const Object& dictionary, std::uint64_t index);
    std::uint64_t uid(const Object& uid);
    // A boolean, integer, real, date, text or data. An integer beyond 64 bits with sign becomes a real.
    Value scalar(const Object& object);
    // Bytes that are no characters become U+FFFD.
    std::string text(const Object& text);
    Data data(const Object& data);

    // The first value under a text key; nil when there is none.
    std::optional<Object> find(const Object& dictionary, std::string_view key);
    // Whether the object is this text. Reads no more than could be equal.
    bool isText(const Object& object, std::string_view text);

  private:
    void readTrailer();
    Object object(std::uint64_t number);
    Object objectAt(std::uint64_t offset);
    Object simpleObject(unsigned detail, std::uint64_t offset) const;
    Object numberObject(Kind kind, std::size_t width, std::uint64_t offset) const;
    Object countedObject(Kind kind, std::size_t width, unsigned detail, std::uint64_t offset);
    std::uint64_t longCount(std::uint64_t& offset);
    void requireRoom(std::uint64_t offset, std::uint64_t count, std::size_t width) const;

    Object referredObject(const Object& container, std::uint64_t index);
    Value integer(const Object& integer);
    double real(const Object& real);
    std::string textOfUTF8(const Object& text);
    std::string textOfUTF16(const Object& text);

    void read(std::uint64_t offset, std::span<std::byte> buffer);
    // An unsigned big-endian number of 1 to 8 bytes.
    std::uint64_t number(std::uint64_t offset, std::size_t width);
    // The same, wherever it lies.
    std::uint64_t readNumber(std::uint64_t offset, std::size_t width);

    PageCache bytes_;
    std::size_t offsetWidth_ = 0;
    std::size_t referenceWidth_ = 0;
    std::uint64_t objectCount_ = 0;
    std::uint64_t topObject_ = 0;
    std::uint64_t offsetTable_ = 0;  // also where the objects end
    std::uint64_t visitsLeft_ = ~std::uint64_t{0};
};

}  // namespace platform
