// An item while a query is asked of it: fetches each property at most once, and none before it is needed.
// Belongs to one thread.
#pragma once

#include <map>
#include <optional>
#include <string>

#include "host/VXMetadata.h"
#include "platform/Date.h"

namespace vexo {

class QueriedItem {
  public:
    // The arguments outlive the object.
    QueriedItem(const VXMetadataProperties& properties, const platform::Date& now)
        : properties_(properties), now_(now) {}

    const platform::Date& now() const { return now_; }

    // nil for a property that the item lacks.
    const std::optional<platform::Value>& property(const std::string& key);
    const platform::Dictionary& allProperties();

  private:
    const VXMetadataProperties& properties_;
    const platform::Date& now_;
    std::map<std::string, std::optional<platform::Value>> fetched_;
    std::optional<platform::Dictionary> all_;
};

}  // namespace vexo
