// Makes AppleDouble files.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "tests/platform/FileBytes.h"

namespace testing_support {

using SidecarAttributes = std::vector<std::pair<std::string, std::string>>;

// A file with an empty resource fork and the attributes, laid out as the system that invented it does.
inline std::string sidecarWithAttributes(const SidecarAttributes& attributes) {
    constexpr std::size_t finderInformationOffset = 50, attributesOffset = 84, listOffset = 120;
    const auto entrySize = [](const std::string& name) { return (11 + name.size() + 1 + 3) / 4 * 4; };
    std::size_t valueOffset = listOffset;
    for (const auto& [name, value] : attributes)
        valueOffset += entrySize(name);
    const std::size_t firstValue = valueOffset;

    std::string list, values;
    for (const auto& [name, value] : attributes) {
        std::string entry = bigEndian(valueOffset, 4) + bigEndian(value.size(), 4) + bigEndian(0, 2) +
                            bigEndian(name.size() + 1, 1) + name;
        entry.resize(entrySize(name), '\0');
        list += entry;
        values += value;
        valueOffset += value.size();
    }
    std::string file =
        bigEndian(0x00051607, 4) + bigEndian(0x00020000, 4) + std::string(16, ' ') + bigEndian(2, 2);
    file += bigEndian(9, 4) + bigEndian(finderInformationOffset, 4) + bigEndian(valueOffset - 50, 4);
    file += bigEndian(2, 4) + bigEndian(valueOffset, 4) + bigEndian(0, 4);
    file.resize(attributesOffset, '\0');
    file += "ATTR" + bigEndian(0, 4) + bigEndian(valueOffset, 4) + bigEndian(firstValue, 4) +
            bigEndian(values.size(), 4) + std::string(12, '\0') + bigEndian(0, 2) +
            bigEndian(attributes.size(), 2);
    return file + list + values;
}

}  // namespace testing_support
