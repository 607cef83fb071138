#include "framework/pathwatcher/ChangeBurst.h"

#include <utility>

namespace vexo {

void ChangeBurst::add(const std::string& watchedPath, std::string changedPath) {
    if (!latest_ || latest_->first != watchedPath)
        latest_ = &*changes_.try_emplace(watchedPath).first;
    latest_->second.push_back(std::move(changedPath));
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
