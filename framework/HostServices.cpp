#include "framework/HostServices.h"

#include <atomic>
#include <stdexcept>

#include "framework/BundleStrings.h"
#include "framework/FrameworkResources.h"
#include "framework/MetadataProvider.h"
#include "host/VXMediaBrowserImageManager.h"
#include "host/VXMediaBrowserUtilities.h"
#include "host/VXPathWatcher.h"

namespace vexo {
namespace {

std::atomic<const HostServices*> currentServices = nullptr;

}  // namespace

const HostServices* hostServicesIfAny() {
    return currentServices.load(std::memory_order_acquire);
}

const HostServices& hostServices() {
    if (const HostServices* services = hostServicesIfAny())
        return *services;
    throw std::logic_error("the host's services are used before a host exists");
}

HostServicesScope::HostServicesScope(const HostServices& services)
    : services_(services), previous_(currentServices.exchange(&services_)) {}

HostServicesScope::~HostServicesScope() {
    currentServices.store(previous_);
}

VXPathWatcher& VXPathWatcher::sharedPathWatcher() {
    return hostServices().pathWatcher;
}

VXMediaBrowserImageManager& VXMediaBrowserImageManager::sharedInstance() {
    return hostServices().imageManager;
}

std::string VXMediaBrowserUtilities::localizedStringForKey(std::string_view key, std::string_view value) {
    return frameworkStrings().stringForKey(key).value_or(std::string(value));
}

bool VXMediaBrowserUtilities::supportedMovieFile(const std::string& path) {
    return hostServices().metadata.supportedMovieFile(path);
}

bool VXMediaBrowserUtilities::supportedPlainFile(const std::string& path) {
    return hostServices().metadata.supportedPlainFile(path);
}

}  // namespace vexo
