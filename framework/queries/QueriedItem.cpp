#include "framework/queries/QueriedItem.h"

namespace vexo {

const std::optional<platform::Value>& QueriedItem::property(const std::string& key) {
    const auto known = fetched_.find(key);
    if (known != fetched_.end())
        return known->second;
    return fetched_.emplace(key, properties_.valueForKey(key)).first->second;
}

const platform::Dictionary& QueriedItem::allProperties() {
    if (!all_)
        all_ = properties_.allValues();
    return *all_;
}

}  // namespace vexo
