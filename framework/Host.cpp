#include "framework/Host.h"

#include <algorithm>

#include "framework/GuardedWork.h"
#include "framework/HostServices.h"
#include "framework/ImageManager.h"
#include "framework/PluginSearch.h"
#include "framework/WarningLog.h"
#include "framework/metadata/FileTypes.h"
#include "framework/metadata/MediaReader.h"
#include "framework/metadata/MetadataIndex.h"
#include "framework/metadata/MetadataPrefetcher.h"
#include "framework/metadata/MetadataStore.h"
#include "framework/pathwatcher/PathWatcher.h"
#include "framework/thumbnails/Thumbnailer.h"
#include "host/VXConstants.h"
#include "platform/Notification.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/linux/LinuxDispatcher.h"
#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/LinuxSystemLog.h"
#include "platform/linux/LinuxUserDefaults.h"
#include "platform/linux/LinuxWorkspace.h"
#include "platform/linux/MountTable.h"

namespace vexo {
namespace {

constexpr const char* processDefaultsDomain = "com.vexo.browser";
// Starting a media reader takes longer than reading most movies, and an idle one holds some megabytes.
constexpr std::chrono::seconds idleReaderTime{30};

std::optional<std::string> chosenHome(const HostOptions& options) {
    return options.homeDirectory ? options.homeDirectory : platform::LinuxFileManager::userHomeDirectory();
}

// The folder of the suite's preference file, in the home that is browsed.
std::string preferencesFolder(const std::optional<std::string>& home) {
    const std::string file(VXSuitePrefsPath.substr(1));  // without its "~"
    return platform::path::withoutLastComponent(home.value_or("") + file);
}

std::shared_ptr<ProcessMediaReader> newMediaReader(Diagnostics& diagnostics) {
    ProcessMediaReader::Settings settings{mediaReaderProgram()};
    settings.afterIdleTime = [](std::function<void()> block) {
        platform::services().dispatcher.afterInBackground(idleReaderTime, std::move(block));
    };
    settings.warn = [&diagnostics](const std::string& problem) { diagnostics.warn(problem); };
    return std::make_shared<ProcessMediaReader>(std::move(settings));
}

std::shared_ptr<MetadataPrefetcher> newPrefetcher(const std::shared_ptr<ProcessMediaReader>& reader) {
    const auto metadata = std::make_shared<MetadataStore>(MetadataIndex::defaultPath(), reader);
    return std::make_shared<MetadataPrefetcher>([metadata](const std::string& path) {
        metadata->propertiesForFile(path)->valueForKey(kMDItemMediaTypes);
    });
}

}  // namespace

// In order of construction. The dispatcher is taken down first of all, by the host, while everything that its
// work uses is still there.
struct Host::State {
    explicit State(const HostOptions& hostOptions)
        : options(hostOptions),
          home(chosenHome(options)),
          log("vexo", options.verbosity == Verbosity::verbose
                          ? platform::LinuxSystemLog::StandardError::copies
                          : platform::LinuxSystemLog::StandardError::silent),
          diagnostics(log, options.verbosity),
          fileWarnings(diagnostics),
          files(home, mounts, fileWarnings, isPackageExtension),
          workspace(mounts, log),
          userDefaults(preferencesFolder(home), processDefaultsDomain, &fileWarnings),
          reader(newMediaReader(diagnostics)),
          backgroundReader(newMediaReader(diagnostics)),
          metadata(MetadataIndex::defaultPath(), reader),
          prefetcher(options.prefetchesMetadata ? newPrefetcher(backgroundReader) : nullptr),
          thumbnails(ThumbnailMaker(ThumbnailCache(ThumbnailCache::defaultFolder()), backgroundReader)),
          images([this](const std::string& path) { return metadata.supportedMovieFile(path); }),
          dispatcher(std::make_unique<platform::LinuxDispatcher>(log)),
          platformScope({files, workspace, userDefaults, *dispatcher, notifications, log}),
          hostScope({pathWatcher, images, metadata, thumbnails, diagnostics}) {
        dispatcher->setFailureHandler([](const platform::Dispatcher::Block& block,
                                         std::exception_ptr failure) { recoverFrom(failure, block); });
    }

    const HostOptions options;
    const std::optional<std::string> home;
    platform::LinuxSystemLog log;
    Diagnostics diagnostics;
    WarningLog fileWarnings;
    platform::SystemMountTable mounts;
    platform::LinuxFileManager files;
    platform::LinuxWorkspace workspace;
    platform::LinuxUserDefaults userDefaults;
    platform::NotificationCenter notifications;
    PathWatcher pathWatcher;
    const std::shared_ptr<ProcessMediaReader> reader;
    // Nobody waits for what it reads, so a property that somebody waits for never stands behind that.
    const std::shared_ptr<ProcessMediaReader> backgroundReader;
    MetadataStore metadata;
    const std::shared_ptr<MetadataPrefetcher> prefetcher;  // nil where nothing is prefetched
    Thumbnailer thumbnails;
    ImageManager images;
    std::unique_ptr<platform::LinuxDispatcher> dispatcher;
    platform::ServicesScope platformScope;
    HostServicesScope hostScope;
    std::vector<LoadedPlugin> plugins;
};

Host::Host(const HostOptions& options) : state_(std::make_unique<State>(options)) {
    state_->pathWatcher.setWarningHandler(
        [&diagnostics = state_->diagnostics](const std::string& warning) { diagnostics.warn(warning); });
    if (options.followsChanges) {
        state_->workspace.followMounts();
        state_->pathWatcher.start();
    }
}

Host::~Host() {
    for (const LoadedPlugin& plugin : state_->plugins)
        plugin.manager->close();
    state_->pathWatcher.close();
    state_->thumbnails.close();
    if (state_->prefetcher)
        state_->prefetcher->close();
    // Nobody waits for a movie any more.
    state_->reader->close();
    state_->backgroundReader->close();
    for (const LoadedPlugin& plugin : state_->plugins)
        plugin.manager->waitUntilLoaded();
    state_->dispatcher.reset();
}

std::optional<std::string> Host::loadPlugins() {
    const bool named = !state_->options.pluginBundles.empty();
    for (const std::string& bundlePath : pluginBundles(state_->options.pluginBundles)) {
        const std::optional<std::string> problem = loadPlugin(bundlePath);
        if (problem && named)
            return problem;
        if (problem)
            state_->diagnostics.warn(*problem);
    }
    return std::nullopt;
}

// The first bundle with an identifier is taken, those found after it are left alone.
std::optional<std::string> Host::loadPlugin(const std::string& bundlePath) {
    BundleResult opened = Bundle::open(bundlePath);
    if (!opened.bundle)
        return opened.error;
    const bool known =
        std::any_of(state_->plugins.begin(), state_->plugins.end(), [&](const LoadedPlugin& plugin) {
            return plugin.bundle->identifier() == opened.bundle->identifier();
        });
    if (known)
        return std::nullopt;

    if (const std::string& warning = opened.bundle->warning(); !warning.empty())
        state_->diagnostics.warn(warning);
    std::string error = "the plug-in '" + bundlePath + "' could not be initialised";
    const auto principalClass = guardedAnswer([&] { return opened.bundle->principalClass(error); });
    if (!principalClass)
        return error;
    std::shared_ptr<VXMediaManager> manager =
        guardedAnswer([&] { return principalClass->newObject(opened.bundle); });
    if (!manager)
        return error;
    if (state_->prefetcher)
        manager->addTreeObserver(
            state_->prefetcher,
            [&prefetcher = *state_->prefetcher](const VXMediaGroupRef& root) { prefetcher.prefetch(root); });
    state_->plugins.push_back({std::move(opened.bundle), principalClass, std::move(manager)});
    return std::nullopt;
}

const std::vector<LoadedPlugin>& Host::plugins() const {
    return state_->plugins;
}

void Host::startLoading() {
    for (const LoadedPlugin& plugin : state_->plugins)
        runGuarded([&] { plugin.manager->loadData(); });
}

bool Host::waitUntilLoaded(std::chrono::nanoseconds atMost) const {
    const auto deadline = std::chrono::steady_clock::now() + atMost;
    return std::all_of(
        state_->plugins.begin(), state_->plugins.end(), [deadline](const LoadedPlugin& plugin) {
            return plugin.manager->waitUntilLoaded(deadline - std::chrono::steady_clock::now());
        });
}

void Host::cancelLoading() {
    for (const LoadedPlugin& plugin : state_->plugins)
        plugin.manager->cancelLoad();
    if (state_->prefetcher)
        state_->prefetcher->cancel();
}

const MetadataStore& Host::metadata() const {
    return state_->metadata;
}

std::optional<std::vector<std::string>> Host::mediaReaderConfinement() {
    return state_->reader->confinement();
}

Diagnostics& Host::diagnostics() {
    return state_->diagnostics;
}

PathWatcher& Host::pathWatcher() {
    return state_->pathWatcher;
}

std::string Host::suitePreferencesPath() const {
    return platform::path::expandingTilde(VXSuitePrefsPath);
}

std::string Host::userDefaultsPath() const {
    return state_->userDefaults.pathForDomain(processDefaultsDomain);
}

std::string Host::metadataIndexPath() const {
    return state_->metadata.indexPath();
}

}  // namespace vexo
