// Properties as a test sets them, which remember what they were asked for.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "host/VXMetadata.h"

namespace testing_support {

class QueriedProperties final : public vexo::VXMetadataProperties {
  public:
    explicit QueriedProperties(platform::Dictionary values) : values_(std::move(values)) {}

    std::optional<platform::Value> valueForKey(std::string_view key) const override {
        asked.emplace_back(key);
        const platform::Value* value = platform::find(values_, key);
        return value ? std::optional(*value) : std::nullopt;
    }
    platform::Dictionary allValues() const override {
        asked.emplace_back("everything");
        return values_;
    }

    mutable std::vector<std::string> asked;

  private:
    const platform::Dictionary values_;
};

}  // namespace testing_support
