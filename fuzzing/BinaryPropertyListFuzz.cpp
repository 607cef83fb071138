// Reads any bytes as a binary property list. What can be read must survive both written forms.
#include <string_view>

#include "fuzzing/Require.h"
#include "platform/BinaryPropertyList.h"
#include "platform/PropertyList.h"
#include "platform/PropertyListLimits.h"

using namespace platform;

namespace {

// Compares bytes, because a value that holds not-a-number is not equal to itself.
void requireTheSameAfterRewriting(const Value& value) {
    const Data binary = dataWithPropertyList(value, PropertyListFormat::binary);
    const PropertyListResult again = propertyListWithData(binary);
    require(again.value.has_value());
    require(dataWithPropertyList(*again.value, PropertyListFormat::binary) == binary);
}

void requireReadableXML(const Value& value) {
    const Data xml = dataWithPropertyList(value, PropertyListFormat::xml);
    if (xml.size() <= PropertyListLimits::largestXML)
        require(propertyListWithData(xml).value.has_value());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    if (!text.starts_with(BinaryPropertyList::signature))
        return 0;
    const PropertyListResult result = propertyListWithData(std::as_bytes(std::span(text)));
    require(result.value.has_value() == result.error.empty());
    if (result.value) {
        requireTheSameAfterRewriting(*result.value);
        requireReadableXML(*result.value);
    }
    return 0;
}
