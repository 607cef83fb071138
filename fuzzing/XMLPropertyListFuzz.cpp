// Reads any bytes as an XML property list. What can be read must survive being written as XML once and for
// all.
#include <string_view>

#include "fuzzing/Require.h"
#include "platform/PropertyList.h"

using namespace platform;

namespace {

void requireTheSameAfterRewriting(const Value& value, PropertyListFormat format) {
    const Data once = dataWithPropertyList(value, format);
    const PropertyListResult again = propertyListWithData(once);
    require(again.value.has_value());
    require(dataWithPropertyList(*again.value, format) == once);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view text(reinterpret_cast<const char*>(data), size);
    if (text.starts_with("bplist"))
        return 0;
    const PropertyListResult result = propertyListWithData(std::as_bytes(std::span(text)));
    require(result.value.has_value() == result.error.empty());
    if (result.value) {
        requireTheSameAfterRewriting(*result.value, PropertyListFormat::xml);
        requireTheSameAfterRewriting(*result.value, PropertyListFormat::binary);
    }
    return 0;
}
