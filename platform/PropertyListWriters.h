// Writes property lists. Values are taken as they are: their nesting is what whoever built them made it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include "platform/Value.h"

namespace platform {

// The UID that the dictionary {"CF$UID": number} stands for; nil for any other value.
std::optional<std::uint64_t> uidOfPropertyList(const Value& propertyList);

std::vector<std::byte> binaryPropertyList(const Value& propertyList);
std::vector<std::byte> xmlPropertyList(const Value& propertyList);

}  // namespace platform
