// Property lists, binary and XML, read and written whole. For documents of which only a part is wanted,
// see KeyedUnarchiver.h.
//
// Thread-safe (no state). A UID of a keyed archive reads as the dictionary {"CF$UID": number}, the form that
// XML has for it. Everything a file can declare (counts, depths, sizes, references) is bounded: what is
// damaged, nested deeper than 512 levels or refers to itself is an error, never a crash.
#pragma once

#include <cstddef>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "platform/Value.h"

namespace platform {

enum class PropertyListFormat { binary, xml };

// Either a value or an error that says what is wrong with the bytes.
struct PropertyListResult {
    std::optional<Value> value;
    std::string error;
};

// propertyListWithData:options:format:error:; recognises the format by itself.
PropertyListResult propertyListWithData(std::span<const std::byte> bytes);

// dataWithPropertyList:format:options:error:. Reals are written as reals and integers as integers; sizes are
// no property-list type and are written as their text. Characters that XML cannot carry become U+FFFD.
std::vector<std::byte> dataWithPropertyList(const Value& propertyList, PropertyListFormat format);

}  // namespace platform
