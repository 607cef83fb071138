// The services of the host's own that its class operations lean on. Put in place by the program that hosts
// plug-ins, like platform::Services and after them.
#pragma once

namespace vexo {

class Diagnostics;
class MetadataProvider;
class ThumbnailProvider;
class VXMediaBrowserImageManager;
class VXPathWatcher;

struct HostServices {
    VXPathWatcher& pathWatcher;
    VXMediaBrowserImageManager& imageManager;
    const MetadataProvider& metadata;
    ThumbnailProvider& thumbnails;
    Diagnostics& diagnostics;
};

// Requires: a HostServicesScope exists.
const HostServices& hostServices();

// nil where no host is in place: items and images may outlive theirs.
const HostServices* hostServicesIfAny();

// Puts services in place and, when it goes, the ones before it back. Made and destroyed while no other thread
// uses them.
class HostServicesScope {
  public:
    explicit HostServicesScope(const HostServices& services);
    ~HostServicesScope();
    HostServicesScope(const HostServicesScope&) = delete;
    HostServicesScope& operator=(const HostServicesScope&) = delete;

  private:
    const HostServices services_;
    const HostServices* const previous_;
};

}  // namespace vexo
