#include "host/VXMediaManager.h"

#include <atomic>
#include <condition_variable>
#include <exception>
#include <utility>

#include "framework/Diagnostics.h"
#include "framework/DurationBadge.h"
#include "framework/FilePasteboard.h"
#include "framework/GuardedWork.h"
#include "framework/HostServices.h"
#include "framework/MediaObjectRegistry.h"
#include "platform/Dispatcher.h"
#include "platform/ObserverList.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

struct VXMediaManager::State {
    MediaObjectRegistry registry;

    std::atomic<bool> firstTimeCallingLoadData = true;
    std::atomic<bool> needsReload = false;
    std::atomic<bool> autoReloadEnabled = false;
    std::atomic<double> loadThreadPriority = 0.5;
    std::atomic<bool> cancelPending = false;

    platform::Mutex mutex;
    std::condition_variable_any loadEnded;
    bool loading VX_GUARDED_BY(mutex) = false;
    bool loadAgain VX_GUARDED_BY(mutex) = false;  // a request arrived during the load in progress
    bool closed VX_GUARDED_BY(mutex) = false;
    VXMediaGroupRef root VX_GUARDED_BY(mutex);

    platform::ObserverList<VXMediaGroupRef> observers;
};

VXMediaManager::VXMediaManager(VXBundleRef bundle)
    : bundle_(std::move(bundle)), state_(std::make_unique<State>()) {}

VXMediaManager::~VXMediaManager() = default;

VXMediaManager* VXMediaManager::init() {
    return this;
}

std::shared_ptr<platform::Menu> VXMediaManager::contextMenuForMediaObject(const VXMediaObjectRef&,
                                                                          const VXMediaGroupRef&) {
    return nullptr;
}

std::shared_ptr<platform::Menu> VXMediaManager::contextMenuForMediaGroup(const VXMediaGroupRef&) {
    return nullptr;
}

platform::ImageRef VXMediaManager::thumbnailOverlayForMediaObject(const VXMediaObjectRef& mediaObject,
                                                                  const std::vector<VXMediaGroupRef>&,
                                                                  platform::Size atSize) {
    return durationBadge(mediaObject->duration(), atSize);
}

void VXMediaManager::watchedPathChanged(const std::string&, std::uint64_t) {}

void VXMediaManager::watchedQueryChanged(const platform::Notification&, const VXPathListRef&) {}

// --- Loading -----------------------------------------------------------------------------------------------

void VXMediaManager::loadData() {
    state_->firstTimeCallingLoadData = false;
    state_->needsReload = false;
    {
        Locked lock(state_->mutex);
        if (state_->closed)
            return;
        if (state_->loading) {
            state_->loadAgain = true;
            return;
        }
        state_->loading = true;
        state_->cancelPending = false;
    }
    platform::services().dispatcher.detachThread("vexo-load", state_->loadThreadPriority,
                                                 [self = shared_from_this()] { self->runLoads(); });
}

void VXMediaManager::runLoads() {
    for (bool again = true; again;) {
        loadOnce();
        Locked lock(state_->mutex);
        again = std::exchange(state_->loadAgain, false) && !state_->closed;
        state_->loading = again;
        state_->cancelPending = state_->closed;
        if (!again)
            state_->loadEnded.notify_all();
    }
}

// A tree from a load that was cancelled or failed is dropped, so that the last good one stays.
void VXMediaManager::loadOnce() {
    runGuarded([this] {
        const VXMediaGroupRef root = performLoadData();
        if (root && !state_->cancelPending)
            setRootMediaGroup(root);
    });
}

bool VXMediaManager::firstTimeCallingLoadData() const {
    return state_->firstTimeCallingLoadData;
}

bool VXMediaManager::needsReload() const {
    return state_->needsReload;
}

void VXMediaManager::setNeedsReload(bool needsReload) {
    state_->needsReload = needsReload;
    // Before the first load the host decides when to begin.
    if (!needsReload || !state_->autoReloadEnabled || state_->firstTimeCallingLoadData)
        return;
    using platform::RunLoopMode;
    platform::services().dispatcher.performOnMainRunLoop(platform::Dispatcher::Delay::zero(),
                                                         {RunLoopMode::kCFRunLoopCommonModes},
                                                         [weakSelf = weak_from_this()] {
                                                             const auto self = weakSelf.lock();
                                                             if (self && self->needsReload())
                                                                 self->loadData();
                                                         });
}

bool VXMediaManager::autoReloadEnabled() const {
    return state_->autoReloadEnabled;
}

void VXMediaManager::setAutoReloadEnabled(bool enabled) {
    state_->autoReloadEnabled = enabled;
}

double VXMediaManager::loadThreadPriority() const {
    return state_->loadThreadPriority;
}

void VXMediaManager::setLoadThreadPriority(double priority) {
    state_->loadThreadPriority = priority;
}

bool VXMediaManager::isLoading() const {
    Locked lock(state_->mutex);
    return state_->loading;
}

bool VXMediaManager::isCancelLoadRequestPending() const {
    return state_->cancelPending.load(std::memory_order_relaxed);
}

void VXMediaManager::cancelLoad() {
    Locked lock(state_->mutex);
    state_->loadAgain = false;
    if (state_->loading)
        state_->cancelPending = true;
}

bool VXMediaManager::waitUntilLoaded(std::chrono::nanoseconds atMost) const {
    const auto deadline = std::chrono::steady_clock::now() + atMost;
    Locked lock(state_->mutex);
    while (state_->loading) {
        if (state_->loadEnded.wait_until(state_->mutex, deadline) == std::cv_status::timeout)
            break;
    }
    return !state_->loading;
}

void VXMediaManager::waitUntilLoaded() const {
    Locked lock(state_->mutex);
    while (state_->loading)
        state_->loadEnded.wait(state_->mutex);
}

void VXMediaManager::close() {
    Locked lock(state_->mutex);
    state_->closed = true;
    state_->cancelPending = true;
}

// --- The tree ----------------------------------------------------------------------------------------------

VXMediaGroupRef VXMediaManager::rootMediaGroup() const {
    Locked lock(state_->mutex);
    return state_->root;
}

void VXMediaManager::setRootMediaGroup(VXMediaGroupRef group) {
    state_->registry.setTree(group);
    VXMediaGroupRef previous = group;  // freed outside the lock: a tree may be large
    {
        Locked lock(state_->mutex);
        state_->root.swap(previous);
    }
    previous = nullptr;
    state_->observers.notify(group);
}

void VXMediaManager::addTreeObserver(std::weak_ptr<const void> observer, TreeObserver handler) {
    state_->observers.add(std::move(observer), std::move(handler));
}

VXMediaGroupRef VXMediaManager::newMediaGroupWithTypeIdentifier(const VXGroupTypeIdentifier& typeIdentifier,
                                                                std::optional<std::string> groupID) {
    return std::make_shared<VXMediaGroup>(typeIdentifier, std::move(groupID));
}

VXMediaObjectRef VXMediaManager::newMediaObjectWithType(int mediaType, std::string name,
                                                        std::string objectID) {
    return std::make_shared<VXMediaObject>(mediaType, std::move(name), std::move(objectID));
}

VXMediaObjectRef VXMediaManager::mediaObjectForID(const std::string& ID) const {
    return state_->registry.objectForID(ID);
}

std::optional<std::string> VXMediaManager::localizedString(std::string_view key) const {
    return bundle_->localizedString(key);
}

platform::ImageRef VXMediaManager::iconNamed(std::string_view name) const {
    return bundle_->iconNamed(name);
}

// --- Pasteboard --------------------------------------------------------------------------------------------

bool VXMediaManager::writeMediaGroups(const std::vector<VXMediaGroupRef>& mediaGroups,
                                      platform::Pasteboard& toPasteboard) {
    return writeFiles(filesOfMediaGroups(mediaGroups), toPasteboard, this);
}

bool VXMediaManager::writeMediaObjects(const std::vector<VXMediaObjectRef>& mediaObjects,
                                       platform::Pasteboard& toPasteboard) {
    return writeFiles(filesOfMediaObjects(mediaObjects), toPasteboard, this);
}

}  // namespace vexo
