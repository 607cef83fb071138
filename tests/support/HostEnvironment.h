// Everything a plug-in finds around itself, for the length of a test: a home of its own with the real file
// system, a made-up desktop, preferences and metadata as the test sets them, and a clock that the test moves.
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "framework/BundleStrings.h"
#include "framework/Diagnostics.h"
#include "framework/HostServices.h"
#include "framework/ImageManager.h"
#include "framework/MetadataProvider.h"
#include "framework/ThumbnailProvider.h"
#include "framework/pathwatcher/PathWatcher.h"
#include "host/VXPlugin.h"
#include "platform/Notification.h"
#include "platform/Services.h"
#include "platform/SystemLog.h"
#include "platform/UserDefaults.h"
#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/MountTable.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/FakeWorkspace.h"
#include "tests/support/TemporaryFolder.h"
#include "tests/support/VirtualDispatcher.h"

namespace testing_support {

// Keeps what was logged.
class RecordingLog final : public platform::SystemLog {
  public:
    void log(std::string_view line) override VX_EXCLUDES(mutex_);
    std::vector<std::string> lines() const VX_EXCLUDES(mutex_);

  private:
    mutable platform::Mutex mutex_;
    std::vector<std::string> lines_ VX_GUARDED_BY(mutex_);
};

// Preferences as a test sets them. What is set in `stored` is seen after the next `synchronize`.
class FakeUserDefaults final : public platform::UserDefaults {
  public:
    void synchronize() override VX_EXCLUDES(mutex_);
    std::optional<platform::Dictionary> persistentDomainForName(std::string_view name) override
        VX_EXCLUDES(mutex_);
    std::optional<platform::Value> objectForKey(std::string_view key) override VX_EXCLUDES(mutex_);

    void storeDomain(std::string name, platform::Dictionary domain) VX_EXCLUDES(mutex_);
    void setForProcess(std::string key, platform::Value value) VX_EXCLUDES(mutex_);

  private:
    using Domains = std::map<std::string, platform::Dictionary, std::less<>>;

    platform::Mutex mutex_;
    Domains stored_ VX_GUARDED_BY(mutex_);
    Domains seen_ VX_GUARDED_BY(mutex_);
    platform::Dictionary process_ VX_GUARDED_BY(mutex_);
};

// Metadata as a test sets it by path. Movies are told by the extensions mov, mp4, m4v, 3gp and dv. Counts how
// often a property was asked for.
class FakeMetadata final : public vexo::MetadataProvider {
  public:
    vexo::VXMetadataPropertiesRef propertiesForFile(const std::string& path) const override;
    bool supportedMovieFile(const std::string& path) const override;

    void set(const std::string& path, platform::Dictionary properties) VX_EXCLUDES(mutex_);
    // Pixel width and height, and a duration in seconds.
    void setMovie(const std::string& path, platform::Size size, double duration = 10);
    std::optional<platform::Value> value(const std::string& path, std::string_view key) const
        VX_EXCLUDES(mutex_);
    platform::Dictionary all(const std::string& path) const VX_EXCLUDES(mutex_);
    int questions() const VX_EXCLUDES(mutex_);

  private:
    mutable platform::Mutex mutex_;
    std::map<std::string, platform::Dictionary> properties_ VX_GUARDED_BY(mutex_);
    mutable int questions_ VX_GUARDED_BY(mutex_) = 0;
};

// Thumbnails that are never made; each is named after its file.
class FakeThumbnails final : public vexo::ThumbnailProvider {
  public:
    platform::ImageRef thumbnailOfFile(const std::string& path) override;
};

// The plug-in's resources as they lie in the source tree; texts and icons can be replaced or taken away.
class SourceBundle final : public vexo::VXBundle {
  public:
    SourceBundle();

    const std::string& path() const override { return path_; }
    const std::string& identifier() const override { return identifier_; }
    std::optional<std::string> localizedString(std::string_view key) const override;
    platform::ImageRef iconNamed(std::string_view name) const override;

    std::map<std::string, std::optional<std::string>, std::less<>> replacedStrings;
    std::map<std::string, platform::ImageRef, std::less<>> replacedIcons;  // nil takes the icon away

  private:
    const std::string path_;
    const std::string identifier_ = "com.vexo.plugin.reelix";
    const vexo::BundleStrings strings_;
};

class HostEnvironment {
  public:
    HostEnvironment();
    ~HostEnvironment();

    // Moves or takes away the home, which is `home` at first; the file manager is made anew.
    void setHomeDirectory(std::optional<std::string> homeDirectory);

    TemporaryFolder home;
    RecordingLog log;
    FakeMountTable mounts;
    FakeWorkspace workspace;
    FakeUserDefaults userDefaults;
    VirtualDispatcher dispatcher;
    platform::NotificationCenter notifications;
    FakeMetadata metadata;
    FakeThumbnails thumbnails;
    vexo::Diagnostics diagnostics{log, vexo::Verbosity::verbose};
    vexo::PathWatcher watcher;
    std::shared_ptr<SourceBundle> bundle;

    platform::FileManager& files() { return *files_; }

  private:
    ScopedEnvironment language_{"LANGUAGE", "en"};
    ScopedEnvironment locale_{"LC_ALL", "C.UTF-8"};
    ScopedEnvironment zone_{"TZ", "UTC0"};
    std::unique_ptr<platform::LinuxFileManager> files_;
    vexo::ImageManager images_;
    std::optional<platform::ServicesScope> platformScope_;
    std::optional<vexo::HostServicesScope> hostScope_;
};

}  // namespace testing_support
