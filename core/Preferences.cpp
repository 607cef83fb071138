#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "platform/Dispatcher.h"
#include "platform/Services.h"
#include "platform/UserDefaults.h"

namespace reelix {
namespace {

// "dateSortReverse" in the "Reelix" dictionary of the suite's preferences; nil when any of them is missing.
std::optional<bool> storedEventOrder() {
    const auto suite =
        platform::services().userDefaults.persistentDomainForName(vexo::VXSuitePrefsDomainName);
    const platform::Value* reelix = suite ? platform::find(*suite, ReelixApplicationName) : nullptr;
    if (!reelix || !reelix->dictionary())
        return std::nullopt;
    const platform::Value* order = platform::find(*reelix->dictionary(), "dateSortReverse");
    return order ? order->boolValue() : std::nullopt;
}

// Takes a lock that may not exist yet.
class LockedIfPresent {
  public:
    explicit LockedIfPresent(platform::Mutex* lock) : lock_(lock) {
        if (lock_)
            guard_.emplace(*lock_);
    }

  private:
    platform::Mutex* const lock_;
    std::optional<platform::Locked<platform::Mutex>> guard_;
};

}  // namespace

// The order is never applied in place: a change leads to one whole event reload, merged with any other that
// is pending, and that reload sorts by the newest value.
void VXReelixPlugin::_checkReelixPreferences() {
    const LockedIfPresent lock(_updatePreferencesLock.get());
    platform::services().userDefaults.synchronize();
    const std::optional<bool> mostRecentFirst = storedEventOrder();
    if (!mostRecentFirst || *mostRecentFirst == _mostRecentEventFirst)
        return;
    _mostRecentEventFirst = *mostRecentFirst;
    if (_poolingEventsReload.exchange(true))
        return;

    using platform::RunLoopMode;
    platform::Dispatcher& dispatcher = platform::services().dispatcher;
    auto reload = [plugin = self()] { plugin->_reloadReelixEvents(); };
    if (dispatcher.isMainThread())
        dispatcher.performOnMainRunLoop(
            reloadDelay, {RunLoopMode::kCFRunLoopCommonModes, RunLoopMode::NSModalPanelRunLoopMode}, reload);
    else
        dispatcher.afterInBackground(reloadDelay, reload);
}

}  // namespace reelix
