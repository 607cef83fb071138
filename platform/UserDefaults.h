// The user's preferences: property-list files, one a domain. Callable from any thread.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/Value.h"

namespace platform {

class UserDefaults {
  public:
    virtual ~UserDefaults() = default;

    // Makes edits by other programs visible: what was read before is read again when next asked for.
    virtual void synchronize() = 0;
    // nil when the domain has no file, or one that is no property list with a dictionary at its top.
    virtual std::optional<Dictionary> persistentDomainForName(std::string_view name) = 0;
    // The process's own defaults: what was set for this process, then its domain's file.
    virtual std::optional<Value> objectForKey(std::string_view key) = 0;
};

}  // namespace platform
