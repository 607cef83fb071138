#include "platform/PropertyList.h"

#include "platform/BinaryPropertyList.h"
#include "platform/PropertyListLimits.h"
#include "platform/PropertyListWriters.h"
#include "platform/XMLPropertyList.h"

namespace platform {

namespace {

// Reads all of a binary property list. What is referred to more than once is read and counted each time. A
// null is no value here: an element or entry that holds one is left out.
class WholeReader {
  public:
    explicit WholeReader(ByteSource& source) : list_(source) {}
    Value read();

  private:
    using Kind = BinaryPropertyList::Kind;
    using Object = BinaryPropertyList::Object;

    std::optional<Value> value(const Object& object);
    Value scalar(const Object& object);
    Value uid(const Object& uid);
    Value array(const Object& array);
    Value dictionary(const Object& dictionary);
    std::string key(const Object& key);

    BinaryPropertyList list_;
    PropertyListLimits limits_;
    int nesting_ = 0;
};

Value WholeReader::read() {
    std::optional<Value> top = value(list_.top());
    if (!top)
        throw PropertyListError("there is no value");
    return *std::move(top);
}

std::optional<Value> WholeReader::value(const Object& object) {
    limits_.countValue();
    if (object.kind == Kind::null)
        return std::nullopt;
    const bool nests =
        object.kind == Kind::array || object.kind == Kind::dictionary || object.kind == Kind::uid;
    if (!nests)
        return scalar(object);
    PropertyListLimits::checkNesting(++nesting_);
    Value value = object.kind == Kind::array        ? array(object)
                  : object.kind == Kind::dictionary ? dictionary(object)
                                                    : uid(object);
    --nesting_;
    return value;
}

Value WholeReader::scalar(const Object& object) {
    if (object.kind == Kind::text || object.kind == Kind::data)
        limits_.countBytes(object.count * object.width);
    return list_.scalar(object);
}

Value WholeReader::uid(const Object& uid) {
    const auto number = static_cast<std::int64_t>(list_.uid(uid));
    if (number < 0)
        throw PropertyListError("a UID is too large");
    limits_.countValue();
    return Dictionary{{"CF$UID", number}};
}

Value WholeReader::array(const Object& array) {
    Array elements;
    for (std::uint64_t i = 0; i < array.count; ++i) {
        if (std::optional<Value> element = value(list_.element(array, i)))
            elements.push_back(*std::move(element));
    }
    return elements;
}

Value WholeReader::dictionary(const Object& dictionary) {
    Dictionary entries;
    for (std::uint64_t i = 0; i < dictionary.count; ++i) {
        std::string entryKey = key(list_.key(dictionary, i));
        if (std::optional<Value> entry = value(list_.value(dictionary, i)))
            entries.emplace(std::move(entryKey), *std::move(entry));
    }
    return entries;
}

std::string WholeReader::key(const Object& key) {
    if (key.kind != Kind::text)
        throw PropertyListError("a dictionary's key is no text");
    limits_.countValue();
    limits_.countBytes(key.count * key.width);
    return list_.text(key);
}

bool isBinary(std::span<const std::byte> bytes) {
    const std::string_view text(reinterpret_cast<const char*>(bytes.data()), bytes.size());
    return text.starts_with("bplist");
}

}  // namespace

PropertyListResult propertyListWithData(std::span<const std::byte> bytes) {
    BorrowedByteSource source(bytes);
    try {
        return {isBinary(bytes) ? WholeReader(source).read() : readXMLPropertyList(source), {}};
    } catch (const PropertyListError& error) {
        return {std::nullopt, error.what()};
    }
}

std::vector<std::byte> dataWithPropertyList(const Value& propertyList, PropertyListFormat format) {
    return format == PropertyListFormat::binary ? binaryPropertyList(propertyList)
                                                : xmlPropertyList(propertyList);
}

}  // namespace platform
