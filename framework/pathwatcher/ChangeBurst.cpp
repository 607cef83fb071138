#include "framework/pathwatcher/ChangeBurst.h"

#include <utility>

namespace vexo {

void ChangeBurst::add(const std::string& watchedPath, const std::string& changedPath) {
    if (!latest_ || latest_->first != watchedPath)
        latest_ = &*changes_.try_emplace(watchedPath).first;
    if (!latest_->second.contains(changedPath))
        latest_->second.insert(changedPath);
}

void ChangeBurst::timeIs(Time now) {
    if (!due_ && !isEmpty())
        due_ = now + length;
}

ChangeBurst::Changes ChangeBurst::take() {
    ++number_;
    latest_ = nullptr;
    due_.reset();
    return std::exchange(changes_, {});
}

}  // namespace vexo
