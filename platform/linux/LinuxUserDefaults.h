// Preferences from property-list files, "<folder>/<domain>.plist". Reads only. Callable from any thread.
//
// A file that is there and can't be used counts as no preferences and is told once in the system log, until
// the next synchronize.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"
#include "platform/UserDefaults.h"

namespace platform {

class LinuxUserDefaults final : public UserDefaults {
  public:
    // `processDomain` names the process's own preferences. `systemLog` may be nil.
    LinuxUserDefaults(std::string preferencesFolder, std::string processDomain,
                      SystemLog* systemLog = nullptr);

    // Sets a default for this process alone; it wins over the file's.
    void setForProcess(std::string key, Value value) VX_EXCLUDES(mutex_);

    std::string pathForDomain(std::string_view name) const;

    void synchronize() override VX_EXCLUDES(mutex_);
    std::optional<Dictionary> persistentDomainForName(std::string_view name) override VX_EXCLUDES(mutex_);
    std::optional<Value> objectForKey(std::string_view key) override VX_EXCLUDES(mutex_);

  private:
    using Domain = std::optional<Dictionary>;

    Domain readDomain(std::string_view name) const;

    const std::string preferencesFolder_;
    const std::string processDomain_;
    SystemLog* const systemLog_;

    Mutex mutex_;
    std::map<std::string, Domain, std::less<>> domains_ VX_GUARDED_BY(mutex_);  // those that were read
    Dictionary forProcess_ VX_GUARDED_BY(mutex_);
    std::uint64_t synchronizations_ VX_GUARDED_BY(mutex_) = 0;
};

}  // namespace platform
