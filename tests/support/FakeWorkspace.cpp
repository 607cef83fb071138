#include "tests/support/FakeWorkspace.h"

#include <utility>

using platform::Locked;

namespace testing_support {

void FakeWorkspace::setVolumes(std::vector<std::string> mountPoints) {
    Locked lock(mutex_);
    volumes_ = std::move(mountPoints);
}

void FakeWorkspace::setRemovableMedia(std::vector<std::string> mountPoints) {
    Locked lock(mutex_);
    removableMedia_ = std::move(mountPoints);
}

void FakeWorkspace::setApplicationForCreator(std::string creatorCode,
                                             platform::ApplicationReference application) {
    Locked lock(mutex_);
    applications_.insert_or_assign(std::move(creatorCode), std::move(application));
}

void FakeWorkspace::removeApplicationForCreator(std::string_view creatorCode) {
    Locked lock(mutex_);
    if (const auto found = applications_.find(creatorCode); found != applications_.end())
        applications_.erase(found);
}

void FakeWorkspace::setPathForIdentifier(std::string identifier, std::string path) {
    Locked lock(mutex_);
    paths_.insert_or_assign(std::move(identifier), std::move(path));
}

void FakeWorkspace::setIcon(std::string identifier, platform::ImageRef icon) {
    Locked lock(mutex_);
    icons_.insert_or_assign(std::move(identifier), std::move(icon));
}

void FakeWorkspace::mount(const std::string& mountPoint) {
    {
        Locked lock(mutex_);
        volumes_.push_back(mountPoint);
    }
    notificationCenter().post(
        {std::string(platform::NSWorkspaceDidMountNotification), this, {{"NSDevicePath", mountPoint}}});
}

int FakeWorkspace::creatorLookups() const {
    Locked lock(mutex_);
    return creatorLookups_;
}

int FakeWorkspace::identifierLookups() const {
    Locked lock(mutex_);
    return identifierLookups_;
}

int FakeWorkspace::iconLookups() const {
    Locked lock(mutex_);
    return iconLookups_;
}

std::vector<std::string> FakeWorkspace::mountedLocalVolumePaths() const {
    Locked lock(mutex_);
    return volumes_;
}

std::vector<std::string> FakeWorkspace::mountedRemovableMedia() const {
    Locked lock(mutex_);
    return removableMedia_;
}

std::optional<platform::ApplicationReference> FakeWorkspace::applicationForCreator(
    std::string_view creatorCode) const {
    Locked lock(mutex_);
    ++creatorLookups_;
    const auto found = applications_.find(creatorCode);
    return found != applications_.end() ? std::optional(found->second) : std::nullopt;
}

std::string FakeWorkspace::absolutePathForAppBundleWithIdentifier(std::string_view identifier) const {
    Locked lock(mutex_);
    ++identifierLookups_;
    const auto found = paths_.find(identifier);
    return found != paths_.end() ? found->second : "";
}

platform::ImageRef FakeWorkspace::iconForApplication(
    const platform::ApplicationReference& application) const {
    Locked lock(mutex_);
    ++iconLookups_;
    const auto found = icons_.find(application.identifier);
    return found != icons_.end() ? found->second : nullptr;
}

// Launching and showing fail: whoever looks at that, where nobody shall, does something else than expected.
bool FakeWorkspace::launchAppWithBundleIdentifier(std::string_view identifier, std::uint32_t options) {
    Locked lock(mutex_);
    requests_.push_back("launch " + std::string(identifier) + " " + std::to_string(options));
    return false;
}

bool FakeWorkspace::selectFile(const std::string& path, const std::string& inFileViewerRootedAtPath) {
    Locked lock(mutex_);
    requests_.push_back("select " + path + " in '" + inFileViewerRootedAtPath + "'");
    return false;
}

std::vector<std::string> FakeWorkspace::requests() const {
    Locked lock(mutex_);
    return requests_;
}

}  // namespace testing_support
