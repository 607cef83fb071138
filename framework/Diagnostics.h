// What the host has to say to people: warnings about things they may want to mend, and a trace for those who
// ask for it. Thread-safe.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "platform/ObserverList.h"
#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"

namespace vexo {

enum class Verbosity { normal, verbose };

class Diagnostics {
  public:
    static constexpr std::size_t mostWarnings = 10'000;

    using WarningObserver = std::function<void(const std::string& warning)>;

    // `log` is not owned and outlives the object.
    Diagnostics(platform::SystemLog& log, Verbosity verbosity) : log_(log), verbosity_(verbosity) {}

    // Keeps a warning, logs it and tells the observers. One that is known already is not repeated, and after
    // the first `mostWarnings` a last one says that the others are left out.
    void warn(const std::string& warning) VX_EXCLUDES(mutex_);
    std::vector<std::string> warnings() const VX_EXCLUDES(mutex_);
    // Told of each new warning, on the thread that warns, for as long as `owner` lives. That thread may hold
    // locks of a plug-in's: an observer doesn't wait for other threads. What one raises is dropped.
    void addWarningObserver(std::weak_ptr<const void> owner, WarningObserver observer);

    void log(std::string_view line) { log_.log(line); }
    // Like `log`, in a verbose host only.
    void trace(std::string_view line);

  private:
    // What is to be told of a warning; nil for nothing.
    std::optional<std::string> keep(const std::string& warning) VX_EXCLUDES(mutex_);

    platform::SystemLog& log_;
    const Verbosity verbosity_;
    mutable platform::Mutex mutex_;
    std::vector<std::string> warnings_ VX_GUARDED_BY(mutex_);
    std::unordered_set<std::string> known_ VX_GUARDED_BY(mutex_);
    platform::ObserverList<std::string> observers_;
};

}  // namespace vexo
