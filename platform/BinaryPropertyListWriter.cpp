#include <unicode/unistr.h>

#include <algorithm>
#include <bit>
#include <limits>
#include <map>
#include <span>
#include <string>
#include <unordered_map>

#include "platform/BinaryPropertyList.h"
#include "platform/PropertyListWriters.h"
#include "platform/Text.h"

namespace platform {

namespace {

enum Marker : unsigned {
    integerMarker = 0x10,
    realMarker = 0x23,
    dateMarker = 0x33,
    dataMarker = 0x40,
    asciiMarker = 0x50,
    utf16Marker = 0x60,
    uidMarker = 0x80,
    arrayMarker = 0xA0,
    dictionaryMarker = 0xD0,
};

// The fewest bytes of 1, 2, 4 and 8 that a number fits in.
std::size_t widthOf(std::uint64_t number) {
    if (number <= std::numeric_limits<std::uint8_t>::max())
        return 1;
    if (number <= std::numeric_limits<std::uint16_t>::max())
        return 2;
    return number <= std::numeric_limits<std::uint32_t>::max() ? 4 : 8;
}

// The bytes of one file, growing.
class Output {
  public:
    std::size_t size() const { return bytes_.size(); }
    std::vector<std::byte> take() { return std::move(bytes_); }

    void putByte(unsigned byte) { bytes_.push_back(static_cast<std::byte>(byte)); }
    void putBytes(std::span<const std::byte> bytes) {
        bytes_.insert(bytes_.end(), bytes.begin(), bytes.end());
    }
    void putCharacters(std::string_view text) { putBytes(std::as_bytes(std::span(text))); }
    // Big-endian.
    void putNumber(std::uint64_t number, std::size_t width) {
        for (std::size_t i = width; i-- > 0;)
            putByte(static_cast<unsigned>(number >> (8 * i) & 0xFF));
    }
    void putInteger(std::uint64_t number, std::size_t width) {
        putByte(integerMarker | static_cast<unsigned>(std::countr_zero(width)));
        putNumber(number, width);
    }
    // A marker with a count: in its low half, or as an integer behind it where 15 and more are counted.
    void putCount(Marker marker, std::uint64_t count) {
        putByte(marker | static_cast<unsigned>(std::min<std::uint64_t>(count, 0xF)));
        if (count >= 0xF)
            putInteger(count, widthOf(count));
    }

  private:
    std::vector<std::byte> bytes_;
};

// Numbers all objects first, because the number of objects decides how wide references are; then writes them.
class Writer {
  public:
    std::vector<std::byte> write(const Value& top);

  private:
    using Number = std::uint64_t;
    // One object of the file.
    struct Object {
        const Value* value;     // nil for text
        std::string_view text;  // a text or a dictionary's key
        std::vector<Number> references;
    };

    Number add(const Value& value);
    Number addText(std::string_view text);
    void addElements(Number number, const Array& array);
    void addEntries(Number number, const Dictionary& dictionary);

    void put(const Object& object);
    void putValue(const Value& value, const std::vector<Number>& references);
    void putInteger(std::int64_t number);
    void putReal(Marker marker, double number);
    void putText(std::string_view text);
    void putReferences(const std::vector<Number>& references);
    void putTable(const std::vector<std::uint64_t>& offsets);

    std::vector<Object> objects_;
    std::unordered_map<std::string_view, Number> texts_;  // equal texts are written once
    std::size_t referenceWidth_ = 1;
    Output output_;
};

std::vector<std::byte> Writer::write(const Value& top) {
    add(top);
    referenceWidth_ = widthOf(objects_.size() - 1);
    output_.putCharacters(BinaryPropertyList::signature);
    std::vector<std::uint64_t> offsets;
    for (const Object& object : objects_) {
        offsets.push_back(output_.size());
        put(object);
    }
    putTable(offsets);
    return output_.take();
}

Writer::Number Writer::add(const Value& value) {
    if (const std::string* text = value.string())
        return addText(*text);
    const Number number = objects_.size();
    objects_.push_back({&value, {}, {}});
    if (uidOfPropertyList(value))
        return number;
    if (const Array* array = value.array())
        addElements(number, *array);
    if (const Dictionary* dictionary = value.dictionary())
        addEntries(number, *dictionary);
    return number;
}

Writer::Number Writer::addText(std::string_view text) {
    const auto [known, isNew] = texts_.try_emplace(text, objects_.size());
    if (isNew)
        objects_.push_back({nullptr, text, {}});
    return known->second;
}

void Writer::addElements(Number number, const Array& array) {
    std::vector<Number> references;
    for (const Value& element : array)
        references.push_back(add(element));
    objects_[number].references = std::move(references);
}

void Writer::addEntries(Number number, const Dictionary& dictionary) {
    std::vector<Number> references;
    for (const auto& [key, value] : dictionary)
        references.push_back(addText(key));
    for (const auto& [key, value] : dictionary)
        references.push_back(add(value));
    objects_[number].references = std::move(references);
}

void Writer::put(const Object& object) {
    if (object.value)
        putValue(*object.value, object.references);
    else
        putText(object.text);
}

void Writer::putValue(const Value& value, const std::vector<Number>& references) {
    if (const bool* truth = value.boolean()) {
        output_.putByte(*truth ? 0x09 : 0x08);
    } else if (const std::int64_t* number = value.integer()) {
        putInteger(*number);
    } else if (const double* real = value.real()) {
        putReal(realMarker, *real);
    } else if (const Size* size = value.size()) {
        putText(stringFromSize(*size));
    } else if (const DateRef date = value.date()) {
        putReal(dateMarker, date->secondsSinceReferenceDate());
    } else if (const Data* data = value.data()) {
        output_.putCount(dataMarker, data->size());
        output_.putBytes(*data);
    } else if (const auto uid = uidOfPropertyList(value)) {
        output_.putByte(uidMarker | static_cast<unsigned>(widthOf(*uid) - 1));
        output_.putNumber(*uid, widthOf(*uid));
    } else if (value.array()) {
        output_.putCount(arrayMarker, references.size());
        putReferences(references);
    } else {
        output_.putCount(dictionaryMarker, references.size() / 2);
        putReferences(references);
    }
}

// Only eight bytes have a sign.
void Writer::putInteger(std::int64_t number) {
    const auto bits = static_cast<std::uint64_t>(number);
    output_.putInteger(bits, number < 0 ? 8 : widthOf(bits));
}

void Writer::putReal(Marker marker, double number) {
    output_.putByte(marker);
    output_.putNumber(std::bit_cast<std::uint64_t>(number), 8);
}

void Writer::putText(std::string_view text) {
    if (isASCII(text)) {
        output_.putCount(asciiMarker, text.size());
        output_.putCharacters(text);
        return;
    }
    const auto utf16 = icu::UnicodeString::fromUTF8({text.data(), static_cast<std::int32_t>(text.size())});
    output_.putCount(utf16Marker, static_cast<std::uint64_t>(utf16.length()));
    for (std::int32_t i = 0; i < utf16.length(); ++i)
        output_.putNumber(utf16[i], 2);
}

void Writer::putReferences(const std::vector<Number>& references) {
    for (const Number reference : references)
        output_.putNumber(reference, referenceWidth_);
}

void Writer::putTable(const std::vector<std::uint64_t>& offsets) {
    const std::uint64_t table = output_.size();
    const std::size_t width = widthOf(table);
    for (const std::uint64_t offset : offsets)
        output_.putNumber(offset, width);
    output_.putNumber(0, 6);
    output_.putByte(static_cast<unsigned>(width));
    output_.putByte(static_cast<unsigned>(referenceWidth_));
    output_.putNumber(objects_.size(), 8);
    output_.putNumber(/*top object=*/0, 8);
    output_.putNumber(table, 8);
}

}  // namespace

std::optional<std::uint64_t> uidOfPropertyList(const Value& propertyList) {
    const Dictionary* dictionary = propertyList.dictionary();
    const Value* number = dictionary && dictionary->size() == 1 ? find(*dictionary, "CF$UID") : nullptr;
    if (!number || !number->integer() || *number->integer() < 0)
        return std::nullopt;
    return static_cast<std::uint64_t>(*number->integer());
}

std::vector<std::byte> binaryPropertyList(const Value& propertyList) {
    return Writer().write(propertyList);
}

}  // namespace platform
