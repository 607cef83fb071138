// A desktop that a test makes up: volumes, media and applications as set. Thread-safe.
#pragma once

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "platform/ThreadSafety.h"
#include "platform/Workspace.h"

namespace testing_support {

class FakeWorkspace final : public platform::Workspace {
  public:
    void setVolumes(std::vector<std::string> mountPoints) VX_EXCLUDES(mutex_);
    void setRemovableMedia(std::vector<std::string> mountPoints) VX_EXCLUDES(mutex_);
    void setApplicationForCreator(std::string creatorCode, platform::ApplicationReference application)
        VX_EXCLUDES(mutex_);
    void removeApplicationForCreator(std::string_view creatorCode) VX_EXCLUDES(mutex_);
    void setPathForIdentifier(std::string identifier, std::string path) VX_EXCLUDES(mutex_);
    void setIcon(std::string identifier, platform::ImageRef icon) VX_EXCLUDES(mutex_);

    // What was launched and shown, in order; "launch com.norvale.ReelixApp 65536", "select /a/b in ''".
    std::vector<std::string> requests() const VX_EXCLUDES(mutex_);

    // Adds a volume and posts that it was mounted, on the calling thread.
    void mount(const std::string& mountPoint) VX_EXCLUDES(mutex_);

    // How often each question was asked.
    int creatorLookups() const VX_EXCLUDES(mutex_);
    int identifierLookups() const VX_EXCLUDES(mutex_);
    int iconLookups() const VX_EXCLUDES(mutex_);

    std::vector<std::string> mountedLocalVolumePaths() const override VX_EXCLUDES(mutex_);
    std::vector<std::string> mountedRemovableMedia() const override VX_EXCLUDES(mutex_);
    std::optional<platform::ApplicationReference> applicationForCreator(
        std::string_view creatorCode) const override VX_EXCLUDES(mutex_);
    std::string absolutePathForAppBundleWithIdentifier(std::string_view identifier) const override
        VX_EXCLUDES(mutex_);
    platform::ImageRef iconForApplication(const platform::ApplicationReference& application) const override
        VX_EXCLUDES(mutex_);
    bool launchAppWithBundleIdentifier(std::string_view identifier, std::uint32_t options) override
        VX_EXCLUDES(mutex_);
    bool selectFile(const std::string& path, const std::string& inFileViewerRootedAtPath) override
        VX_EXCLUDES(mutex_);

  private:
    mutable platform::Mutex mutex_;
    std::vector<std::string> volumes_ VX_GUARDED_BY(mutex_) = {"/"};
    std::vector<std::string> removableMedia_ VX_GUARDED_BY(mutex_);
    std::map<std::string, platform::ApplicationReference, std::less<>> applications_ VX_GUARDED_BY(mutex_);
    std::map<std::string, std::string, std::less<>> paths_ VX_GUARDED_BY(mutex_);
    std::map<std::string, platform::ImageRef, std::less<>> icons_ VX_GUARDED_BY(mutex_);
    std::vector<std::string> requests_ VX_GUARDED_BY(mutex_);
    mutable int creatorLookups_ VX_GUARDED_BY(mutex_) = 0;
    mutable int identifierLookups_ VX_GUARDED_BY(mutex_) = 0;
    mutable int iconLookups_ VX_GUARDED_BY(mutex_) = 0;
};

}  // namespace testing_support
