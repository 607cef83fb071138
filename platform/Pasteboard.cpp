#include "platform/Pasteboard.h"

#include <algorithm>

namespace platform {

void Pasteboard::addTypes(const std::vector<std::string>& types, const void* /*owner*/) {
    for (const std::string& type : types) {
        if (!hasType(type))
            types_.push_back(type);
    }
}

bool Pasteboard::setPropertyList(Value propertyList, std::string_view forType) {
    if (!hasType(forType))
        return false;
    values_.insert_or_assign(std::string(forType), std::move(propertyList));
    return true;
}

bool Pasteboard::setString(std::string text, std::string_view forType) {
    return setPropertyList(Value(std::move(text)), forType);
}

std::optional<Value> Pasteboard::valueForType(std::string_view type) const {
    const auto found = values_.find(type);
    return found == values_.end() ? std::nullopt : std::optional(found->second);
}

bool Pasteboard::hasType(std::string_view type) const {
    return std::find(types_.begin(), types_.end(), type) != types_.end();
}

}  // namespace platform
