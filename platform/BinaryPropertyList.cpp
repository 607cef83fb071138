#include "platform/BinaryPropertyList.h"

#include <unicode/unistr.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>

#include "platform/BigEndian.h"
#include "platform/Text.h"

namespace platform {

namespace {

constexpr std::size_t trailerSize = 32;
// The low half of a marker byte that says the count follows as a number of its own.
constexpr unsigned countFollows = 0xF;

unsigned highHalf(std::uint64_t marker) {
    return static_cast<unsigned>(marker) >> 4;
}

unsigned lowHalf(std::uint64_t marker) {
    return static_cast<unsigned>(marker) & 0xF;
}

std::string_view characters(std::span<const std::byte> bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace

BinaryPropertyList::BinaryPropertyList(ByteSource& source) : bytes_(source) {
    std::array<std::byte, signature.size()> start;
    if (bytes_.size() < signature.size() + trailerSize)
        throw PropertyListError("too short for a binary property list");
    read(0, start);
    if (characters(start) != signature)
        throw PropertyListError("not a binary property list of a known version");
    readTrailer();
}

// The trailer: six unused bytes, the width of an offset, the width of a reference, then the number of
// objects, the number of the top object and the place of the offset table, eight bytes each.
void BinaryPropertyList::readTrailer() {
    const std::uint64_t trailer = bytes_.size() - trailerSize;
    offsetWidth_ = number(trailer + 6, 1);
    referenceWidth_ = number(trailer + 7, 1);
    objectCount_ = number(trailer + 8, 8);
    topObject_ = number(trailer + 16, 8);
    offsetTable_ = number(trailer + 24, 8);

    const auto isWidth = [](std::size_t width) { return width >= 1 && width <= 8; };
    if (!isWidth(offsetWidth_) || !isWidth(referenceWidth_))
        throw PropertyListError("the trailer is damaged");
    if (offsetTable_ < signature.size() || offsetTable_ > trailer ||
        objectCount_ > (trailer - offsetTable_) / offsetWidth_)
        throw PropertyListError("the table of objects is outside the file");
}

BinaryPropertyList::Object BinaryPropertyList::object(std::uint64_t objectNumber) {
    if (objectNumber >= objectCount_)
        throw PropertyListError("a reference leads to no object");
    if (visitsLeft_ == 0)
        throw PropertyListError("too many objects have to be read");
    --visitsLeft_;
    return objectAt(number(offsetTable_ + objectNumber * offsetWidth_, offsetWidth_));
}

BinaryPropertyList::Object BinaryPropertyList::objectAt(std::uint64_t offset) {
    if (offset < signature.size())
        throw PropertyListError("an object is outside the file");
    requireRoom(offset, 1, 1);
    const std::uint64_t marker = number(offset, 1);
    const unsigned detail = lowHalf(marker);
    const std::uint64_t content = offset + 1;
    switch (highHalf(marker)) {
        case 0x0:
            return simpleObject(detail, content);
        case 0x1:
            return numberObject(Kind::integer, std::size_t{1} << detail, content);
        case 0x2:
            return numberObject(Kind::real, std::size_t{1} << detail, content);
        case 0x3:
            return numberObject(Kind::date, std::size_t{1} << detail, content);
        case 0x4:
            return countedObject(Kind::data, 1, detail, content);
        case 0x5:
            return countedObject(Kind::text, 1, detail, content);
        case 0x6:
            return countedObject(Kind::text, 2, detail, content);
        case 0x8:
            return numberObject(Kind::uid, detail + 1, content);
        case 0xA:
        case 0xB:
        case 0xC:
            return countedObject(Kind::array, referenceWidth_, detail, content);
        case 0xD:
            return countedObject(Kind::dictionary, 2 * referenceWidth_, detail, content);
        default:
            throw PropertyListError("an object is of an unknown kind");
    }
}

BinaryPropertyList::Object BinaryPropertyList::simpleObject(unsigned detail, std::uint64_t offset) const {
    switch (detail) {
        case 0x0:
        case 0xF:
            return {Kind::null, 0, 0, offset};
        case 0x8:
            return {Kind::boolean, 0, /*count=*/0, offset};
        case 0x9:
            return {Kind::boolean, 0, /*count=*/1, offset};
        default:
            throw PropertyListError("an object is of an unknown kind");
    }
}

BinaryPropertyList::Object BinaryPropertyList::numberObject(Kind kind, std::size_t width,
                                                            std::uint64_t offset) const {
    const bool isKnown = kind == Kind::integer ? width <= 16
                         : kind == Kind::real  ? width == 4 || width == 8
                         : kind == Kind::date  ? width == 8
                                               : width <= 8;
    if (!isKnown)
        throw PropertyListError("a number has an unknown size");
    requireRoom(offset, 1, width);
    return {kind, width, 1, offset};
}

BinaryPropertyList::Object BinaryPropertyList::countedObject(Kind kind, std::size_t width, unsigned detail,
                                                             std::uint64_t offset) {
    const std::uint64_t count = detail == countFollows ? longCount(offset) : detail;
    requireRoom(offset, count, width);
    const bool isContainer = kind == Kind::array || kind == Kind::dictionary;
    if (!isContainer && count > largestText / width)
        throw PropertyListError("a text is too long");
    return {kind, isContainer ? referenceWidth_ : width, count, offset};
}

// Reads the integer that begins at `offset` and moves `offset` behind it.
std::uint64_t BinaryPropertyList::longCount(std::uint64_t& offset) {
    requireRoom(offset, 1, 1);
    const std::uint64_t marker = number(offset, 1);
    const std::size_t width = std::size_t{1} << lowHalf(marker);
    if (highHalf(marker) != 0x1 || width > 8)
        throw PropertyListError("a count is no number");
    const std::uint64_t digits = offset + 1;
    requireRoom(digits, 1, width);
    offset = digits + width;
    return number(digits, width);
}

// A product and no quotient: this is asked for each object, and dividing would be most of it.
void BinaryPropertyList::requireRoom(std::uint64_t offset, std::uint64_t count, std::size_t width) const {
    std::uint64_t size = 0;
    if (offset > offsetTable_ || __builtin_mul_overflow(count, width, &size) || size > offsetTable_ - offset)
        throw PropertyListError("an object is outside the file");
}

BinaryPropertyList::Object BinaryPropertyList::element(const Object& array, std::uint64_t index) {
    return referredObject(array, index);
}

// A dictionary lists the references of its keys, then those of its values.
BinaryPropertyList::Object BinaryPropertyList::key(const Object& dictionary, std::uint64_t index) {
    return referredObject(dictionary, index);
}

BinaryPropertyList::Object BinaryPropertyList::value(const Object& dictionary, std::uint64_t index) {
    return referredObject(dictionary, dictionary.count + index);
}

BinaryPropertyList::Object BinaryPropertyList::referredObject(const Object& container, std::uint64_t index) {
    return object(number(container.offset + index * container.width, container.width));
}

std::uint64_t BinaryPropertyList::uid(const Object& uid) {
    return number(uid.offset, uid.width);
}

Value BinaryPropertyList::scalar(const Object& object) {
    switch (object.kind) {
        case Kind::boolean:
            return object.count != 0;
        case Kind::integer:
            return integer(object);
        case Kind::real:
            return real(object);
        case Kind::date:
            return Date::sinceReferenceDate(real(object));
        case Kind::text:
            return text(object);
        case Kind::data:
            return data(object);
        default:
            throw PropertyListError("an object is of the wrong kind");
    }
}

// One, two and four bytes have no sign, eight and sixteen have one.
Value BinaryPropertyList::integer(const Object& integer) {
    if (integer.width <= 8)
        return static_cast<std::int64_t>(number(integer.offset, integer.width));
    const auto high = static_cast<std::int64_t>(number(integer.offset, 8));
    const std::uint64_t low = number(integer.offset + 8, 8);
    const auto asSigned = static_cast<std::int64_t>(low);
    if (high == (asSigned < 0 ? -1 : 0))
        return asSigned;
    return std::ldexp(static_cast<double>(high), 64) + static_cast<double>(low);
}

double BinaryPropertyList::real(const Object& real) {
    const std::uint64_t bits = number(real.offset, real.width);
    if (real.width == 4)
        return std::bit_cast<float>(static_cast<std::uint32_t>(bits));
    return std::bit_cast<double>(bits);
}

// One byte a unit is meant to be ASCII; some writers leave UTF-8 there.
std::string BinaryPropertyList::text(const Object& text) {
    return text.width == 1 ? textOfUTF8(text) : textOfUTF16(text);
}

std::string BinaryPropertyList::textOfUTF8(const Object& text) {
    std::string utf8(text.count, '\0');
    read(text.offset, std::as_writable_bytes(std::span(utf8)));
    return isValidUTF8(utf8) ? utf8 : validUTF8(utf8);
}

std::string BinaryPropertyList::textOfUTF16(const Object& text) {
    std::u16string units(text.count, u'\0');
    read(text.offset, std::as_writable_bytes(std::span(units)));
    if constexpr (std::endian::native == std::endian::little)
        std::ranges::transform(units, units.begin(), [](char16_t unit) { return __builtin_bswap16(unit); });
    std::string utf8;
    return icu::UnicodeString(/*isTerminated=*/false, units.data(), static_cast<std::int32_t>(units.size()))
        .toUTF8String(utf8);
}

Data BinaryPropertyList::data(const Object& data) {
    Data bytes(data.count);
    read(data.offset, bytes);
    return bytes;
}

std::optional<BinaryPropertyList::Object> BinaryPropertyList::find(const Object& dictionary,
                                                                   std::string_view text) {
    for (std::uint64_t i = 0; i < dictionary.count; ++i) {
        if (isText(key(dictionary, i), text))
            return value(dictionary, i);
    }
    return std::nullopt;
}

// ASCII is the same in UTF-8, so it's compared where it lies.
bool BinaryPropertyList::isText(const Object& object, std::string_view expected) {
    if (object.kind == Kind::text && object.width == 1 && isASCII(expected)) {
        if (object.count != expected.size())
            return false;
        if (const std::byte* found = bytes_.inLatestPage(object.offset, expected.size()))
            return characters({found, expected.size()}) == expected;
    }
    // No unit, of one byte or two, becomes more than three bytes of UTF-8.
    constexpr std::uint64_t mostBytesPerUnit = 3;
    return object.kind == Kind::text && object.count <= expected.size() &&
           object.count * mostBytesPerUnit >= expected.size() && text(object) == expected;
}

void BinaryPropertyList::read(std::uint64_t offset, std::span<std::byte> buffer) {
    if (!bytes_.read(offset, buffer))
        throw PropertyListError("the file can't be read to its end");
}

// Nearly every number lies in the page that was read last.
std::uint64_t BinaryPropertyList::number(std::uint64_t offset, std::size_t width) {
    if (const std::byte* digits = bytes_.inLatestPage(offset, width))
        return bigEndian({digits, width});
    return readNumber(offset, width);
}

std::uint64_t BinaryPropertyList::readNumber(std::uint64_t offset, std::size_t width) {
    std::array<std::byte, 8> digits;
    read(offset, std::span(digits).first(width));
    return bigEndian(std::span(digits).first(width));
}

}  // namespace platform
