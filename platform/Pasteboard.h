// A pasteboard's content: types and their data, as one drag or copy carries them. Belongs to one thread.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Value.h"

namespace platform {

class Pasteboard {
  public:
    // addTypes:owner:; types that are declared already stay where they are. The owner is not kept.
    void addTypes(const std::vector<std::string>& types, const void* owner);
    // setPropertyList:forType: and setString:forType:. False when the type was not declared.
    bool setPropertyList(Value propertyList, std::string_view forType);
    bool setString(std::string text, std::string_view forType);

    const std::vector<std::string>& types() const { return types_; }  // in the order of declaration
    std::optional<Value> valueForType(std::string_view type) const;

  private:
    bool hasType(std::string_view type) const;

    std::vector<std::string> types_;
    std::map<std::string, Value, std::less<>> values_;
};

}  // namespace platform
