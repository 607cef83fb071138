#include "platform/linux/LinuxUserDefaults.h"

#include <fmt/format.h>

#include <cerrno>
#include <span>

#include "platform/Path.h"
#include "platform/PropertyList.h"
#include "platform/linux/LogText.h"
#include "platform/linux/PlainFile.h"

namespace platform {

namespace {

constexpr std::size_t largestPreferences = 8 * 1024 * 1024;

// A domain is the name of a file, never a way to another folder.
bool isDomainName(std::string_view name) {
    return !name.empty() && name.find('/') == std::string_view::npos &&
           name.find('\0') == std::string_view::npos;
}

// Without a problem where there is no file.
struct Preferences {
    std::optional<Dictionary> dictionary;
    std::string problem;
};

Preferences unusable(const std::string& path, std::string_view problem) {
    return {std::nullopt,
            fmt::format("cannot read the preferences {}: {}", printable(path), printable(problem))};
}

Preferences preferencesWithData(const std::string& path, std::string_view data) {
    const auto result = propertyListWithData(std::as_bytes(std::span(data)));
    if (!result.value)
        return unusable(path, result.error);
    const Dictionary* const dictionary = result.value->dictionary();
    return dictionary ? Preferences{*dictionary, {}} : unusable(path, "no dictionary at the top");
}

Preferences readPreferences(const std::string& path) {
    const auto file = PlainFile::open(path);
    if (!file && file.error == ENOENT)
        return {};
    if (!file)
        return {std::nullopt, failureLine("read the preferences", path, file.error)};
    const auto data = contentsOfPlainFile(path, largestPreferences);
    return data ? preferencesWithData(path, *data) : unusable(path, "the file is too large or can't be read");
}

}  // namespace

LinuxUserDefaults::LinuxUserDefaults(std::string preferencesFolder, std::string processDomain,
                                     SystemLog* systemLog)
    : preferencesFolder_(std::move(preferencesFolder)),
      processDomain_(std::move(processDomain)),
      systemLog_(systemLog) {}

void LinuxUserDefaults::setForProcess(std::string key, Value value) {
    Locked lock(mutex_);
    forProcess_.insert_or_assign(std::move(key), std::move(value));
}

std::string LinuxUserDefaults::pathForDomain(std::string_view name) const {
    return path::appending(preferencesFolder_, std::string(name) + ".plist");
}

void LinuxUserDefaults::synchronize() {
    Locked lock(mutex_);
    domains_.clear();
    ++synchronizations_;
}

// Files are read outside the lock. One that was read while another thread synchronized is answered and not
// kept, because it may be older than the edit that the other thread wants to see.
std::optional<Dictionary> LinuxUserDefaults::persistentDomainForName(std::string_view name) {
    std::uint64_t synchronizations;
    {
        Locked lock(mutex_);
        if (const auto found = domains_.find(name); found != domains_.end())
            return found->second;
        synchronizations = synchronizations_;
    }
    Domain domain = readDomain(name);
    Locked lock(mutex_);
    if (synchronizations == synchronizations_)
        domains_.emplace(name, domain);
    return domain;
}

std::optional<Value> LinuxUserDefaults::objectForKey(std::string_view key) {
    {
        Locked lock(mutex_);
        if (const Value* const value = find(forProcess_, key))
            return *value;
    }
    const auto domain = persistentDomainForName(processDomain_);
    const Value* const value = domain ? find(*domain, key) : nullptr;
    return value ? std::optional(*value) : std::nullopt;
}

LinuxUserDefaults::Domain LinuxUserDefaults::readDomain(std::string_view name) const {
    if (!isDomainName(name))
        return std::nullopt;
    auto preferences = readPreferences(pathForDomain(name));
    if (systemLog_ && !preferences.problem.empty())
        systemLog_->log(preferences.problem);
    return std::move(preferences.dictionary);
}

}  // namespace platform
