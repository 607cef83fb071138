#include "framework/pathwatcher/Subscriber.h"

#include "framework/GuardedWork.h"

namespace vexo {

void Subscriber::hear(const std::vector<std::string>& changedPaths) const {
    constexpr std::uint64_t noFlags = 0;
    if (const auto listener = listener_.lock())
        runGuarded([&] { (*listener)(changedPaths); });
    if (const auto observer = observer_.lock())
        for (const std::string& path : changedPaths)
            runGuarded([&] { observer->watchedPathChanged(path, noFlags); });
}

}  // namespace vexo
