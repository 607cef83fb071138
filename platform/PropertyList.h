// Property lists, binary and XML, read and written whole. For documents of which only a part is wanted,
// see KeyedUnarchiver.h.
//
// Thread-safe (no state). A UID of a keyed archive reads as the dictionary {"CF$UID": number}, the form that
// XML has for it, and such a dictionary is written to the binary form as a UID. Sets read as arrays, nulls
// are left out, integers beyond 64 bits with sign read as reals, and the first of several equal keys counts.
//
// Everything a file can declare is bounded; beyond a bound lies an error, never a crash: 512 levels of
// nesting (so whatever refers to itself is an error), a million (2^20) values and 128 MiB of text and data,
// both counted as often as they are referred to, and 128 MiB of XML. XML may not declare entities.
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
// no property-list type and are written as their text. Dates are whole seconds of the years 1 to 9999 in XML.
// The bounds of reading are not checked.
//
// Text that is no UTF-8, as a path may be, and text with characters that XML cannot carry is data in XML:
// exactly its bytes, by which a reader still finds the file. In keys, and in the binary form what is no
// UTF-8, becomes U+FFFD.
std::vector<std::byte> dataWithPropertyList(const Value& propertyList, PropertyListFormat format);

}  // namespace platform
