// A whole host in one object: the platform's services and the host's own, put in place for the process, and
// the plug-ins found. Programs make one first and destroy it last.
//
// Made, used and destroyed on the main thread. While it waits or loads, nothing needs the main loop to run.
#pragma once

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "framework/Bundle.h"
#include "framework/Diagnostics.h"
#include "host/VXMediaManager.h"

namespace vexo {

class MetadataStore;
class PathWatcher;

struct HostOptions {
    // The home to browse; nil for the user's own. Preferences are read from it as well.
    std::optional<std::string> homeDirectory = {};
    // Bundle folders to load instead of those found in the usual places.
    std::vector<std::string> pluginBundles = {};
    Verbosity verbosity = Verbosity::normal;
    // Whether the index learns of every movie of a loaded tree while nobody waits for it. For programs that
    // stay.
    bool prefetchesMetadata = false;
    // Whether trees are kept up to date, by following changes in the file system.
    bool followsChanges = false;
};

// A plug-in that was loaded; no field is nil.
struct LoadedPlugin {
    BundleRef bundle;
    const VXPrincipalClass* principalClass;
    std::shared_ptr<VXMediaManager> manager;
};

class Host {
  public:
    explicit Host(const HostOptions& options);
    // Asks everything in progress to stop and waits for it.
    ~Host();
    Host(const Host&) = delete;
    Host& operator=(const Host&) = delete;

    // Opens the bundles and makes their objects. What is wrong with a bundle is a warning when the bundle was
    // found by itself, and the answer when it was named in the options. Nil when all is well.
    std::optional<std::string> loadPlugins();
    const std::vector<LoadedPlugin>& plugins() const;

    // Sends every plug-in a request to load.
    void startLoading();
    // Waits until no plug-in loads, `atMost` as long. Answers whether that is so.
    bool waitUntilLoaded(std::chrono::nanoseconds atMost) const;
    // Asks the loads in progress to stop, and the work that followed earlier ones.
    void cancelLoading();

    Diagnostics& diagnostics();
    PathWatcher& pathWatcher();
    const MetadataStore& metadata() const;
    // What the program that reads movies has given up, in words for people; nil when it cannot be started.
    std::optional<std::vector<std::string>> mediaReaderConfinement();

    // Files that people may want to look at; they need not exist.
    std::string suitePreferencesPath() const;
    std::string userDefaultsPath() const;
    std::string metadataIndexPath() const;

  private:
    struct State;
    std::optional<std::string> loadPlugin(const std::string& bundlePath);

    const std::unique_ptr<State> state_;
};

}  // namespace vexo
