#include "framework/metadata/MetadataPrefetcher.h"

#include <algorithm>
#include <utility>

#include "framework/GuardedWork.h"
#include "framework/TreeWalk.h"
#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

MetadataPrefetcher::MetadataPrefetcher(ReadFile readFile) : readFile_(std::move(readFile)) {}

void MetadataPrefetcher::prefetch(const VXMediaGroupRef& root) {
    {
        Locked lock(mutex_);
        if (closed_ || !root || isSeen(root))
            return;
        seen_.push_back(root);
        waiting_.push_back(root);
        if (std::exchange(working_, true))
            return;
    }
    platform::services().dispatcher.detachThread("vexo-prefetch", /*priority=*/0,
                                                 [self = shared_from_this()] { self->work(); });
}

bool MetadataPrefetcher::isSeen(const VXMediaGroupRef& root) {
    std::erase_if(seen_, [](const auto& each) { return each.expired(); });
    return std::any_of(seen_.begin(), seen_.end(), [&](const auto& each) { return each.lock() == root; });
}

void MetadataPrefetcher::cancel() {
    Locked lock(mutex_);
    waiting_.clear();
    current_ = nullptr;
}

void MetadataPrefetcher::close() {
    cancel();
    Locked lock(mutex_);
    closed_ = true;
}

void MetadataPrefetcher::work() {
    while (const VXMediaGroupRef root = takeNext())
        runGuarded([&] { readMoviesOf(root); });
}

VXMediaGroupRef MetadataPrefetcher::takeNext() {
    Locked lock(mutex_);
    working_ = !waiting_.empty();
    current_ = working_ ? waiting_.front() : nullptr;
    if (working_)
        waiting_.pop_front();
    return current_;
}

bool MetadataPrefetcher::isWorkingOn(const VXMediaGroupRef& root) const {
    Locked lock(mutex_);
    return current_ == root;
}

// An item that lies in several groups costs a look into the index for each further time.
void MetadataPrefetcher::readMoviesOf(const VXMediaGroupRef& root) {
    visitGroups(root, [&](const VXMediaGroupRef& group) {
        const auto mediaObjects = group->ownMediaObjects().value_or(VXMediaObjectList());
        for (const VXMediaObjectRef& mediaObject : mediaObjects) {
            if (!isWorkingOn(root))
                return false;
            if (const auto path = mediaObject->path())
                readFile_(*path);
        }
        return true;
    });
}

}  // namespace vexo
