#include "tests/support/HostEnvironment.h"

#include <array>

#include "framework/metadata/FileTypes.h"
#include "platform/Path.h"

namespace testing_support {

using platform::Locked;

void RecordingLog::log(std::string_view line) {
    Locked lock(mutex_);
    lines_.emplace_back(line);
}

std::vector<std::string> RecordingLog::lines() const {
    Locked lock(mutex_);
    return lines_;
}

void FakeUserDefaults::synchronize() {
    Locked lock(mutex_);
    seen_ = stored_;
}

std::optional<platform::Dictionary> FakeUserDefaults::persistentDomainForName(std::string_view name) {
    Locked lock(mutex_);
    const auto found = seen_.find(name);
    return found == seen_.end() ? std::nullopt : std::optional(found->second);
}

std::optional<platform::Value> FakeUserDefaults::objectForKey(std::string_view key) {
    Locked lock(mutex_);
    const platform::Value* value = platform::find(process_, key);
    return value ? std::optional(*value) : std::nullopt;
}

void FakeUserDefaults::storeDomain(std::string name, platform::Dictionary domain) {
    Locked lock(mutex_);
    stored_.insert_or_assign(std::move(name), std::move(domain));
}

void FakeUserDefaults::setForProcess(std::string key, platform::Value value) {
    Locked lock(mutex_);
    process_.insert_or_assign(std::move(key), std::move(value));
}

namespace {

class FakeProperties final : public vexo::VXMetadataProperties {
  public:
    FakeProperties(const FakeMetadata& metadata, std::string path)
        : metadata_(metadata), path_(std::move(path)) {}
    std::optional<platform::Value> valueForKey(std::string_view key) const override {
        return metadata_.value(path_, key);
    }
    platform::Dictionary allValues() const override { return metadata_.all(path_); }

  private:
    const FakeMetadata& metadata_;
    const std::string path_;
};

}  // namespace

vexo::VXMetadataPropertiesRef FakeMetadata::propertiesForFile(const std::string& path) const {
    return std::make_shared<FakeProperties>(*this, path);
}

bool FakeMetadata::supportedMovieFile(const std::string& path) const {
    static constexpr std::array<std::string_view, 5> extensions{"mov", "mp4", "m4v", "3gp", "dv"};
    return std::find(extensions.begin(), extensions.end(), platform::path::extension(path)) !=
           extensions.end();
}

void FakeMetadata::set(const std::string& path, platform::Dictionary properties) {
    Locked lock(mutex_);
    properties_.insert_or_assign(path, std::move(properties));
}

void FakeMetadata::setMovie(const std::string& path, platform::Size size, double duration) {
    set(path, {{std::string(vexo::kMDItemPixelWidth), size.width},
               {std::string(vexo::kMDItemPixelHeight), size.height},
               {std::string(vexo::kMDItemDurationSeconds), duration}});
}

std::optional<platform::Value> FakeMetadata::value(const std::string& path, std::string_view key) const {
    const platform::Dictionary properties = all(path);
    const platform::Value* value = platform::find(properties, key);
    return value ? std::optional(*value) : std::nullopt;
}

platform::Dictionary FakeMetadata::all(const std::string& path) const {
    Locked lock(mutex_);
    ++questions_;
    const auto found = properties_.find(path);
    return found == properties_.end() ? platform::Dictionary{} : found->second;
}

int FakeMetadata::questions() const {
    Locked lock(mutex_);
    return questions_;
}

platform::ImageRef FakeThumbnails::thumbnailOfFile(const std::string& path) {
    return std::make_shared<platform::Image>(platform::pictureWithData({}), "thumbnail of " + path);
}

SourceBundle::SourceBundle()
    : path_(VEXO_SOURCE_DIR "/resources"),
      strings_(vexo::BundleStrings::withContentsOfFile(path_ + "/Resources/Strings.ini")) {}

std::optional<std::string> SourceBundle::localizedString(std::string_view key) const {
    const auto replaced = replacedStrings.find(key);
    return replaced != replacedStrings.end() ? replaced->second : strings_.stringForKey(key);
}

platform::ImageRef SourceBundle::iconNamed(std::string_view name) const {
    const auto replaced = replacedIcons.find(name);
    if (replaced != replacedIcons.end())
        return replaced->second;
    auto picture =
        platform::pictureWithContentsOfFile(path_ + "/Resources/Icons/" + std::string(name) + ".svg");
    return picture ? std::make_shared<platform::Image>(std::move(picture), std::string(name)) : nullptr;
}

HostEnvironment::HostEnvironment() : images_([](const std::string&) { return false; }) {
    setHomeDirectory(home.path());
    bundle = std::make_shared<SourceBundle>();
}

HostEnvironment::~HostEnvironment() = default;

void HostEnvironment::setHomeDirectory(std::optional<std::string> homeDirectory) {
    hostScope_.reset();
    platformScope_.reset();
    files_ = std::make_unique<platform::LinuxFileManager>(std::move(homeDirectory), mounts, log,
                                                          vexo::isPackageExtension);
    platformScope_.emplace(
        platform::Services{*files_, workspace, userDefaults, dispatcher, notifications, log});
    hostScope_.emplace(vexo::HostServices{watcher, images_, metadata, thumbnails, diagnostics});
}

}  // namespace testing_support
