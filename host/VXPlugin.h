// The boundary between a plug-in bundle's code and its host.
//
// A bundle's module exports one C symbol, VXPluginPrincipalClass, by which the host gets at the principal
// class. Module and host are built with the same compiler against the same headers;
// VXHostInterfaceVersion in the bundle's descriptor is checked before the code is loaded.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Image.h"
#include "platform/Value.h"

namespace vexo {

class VXMediaManager;

// Raised by each release, after the first, that changes in a header of host/ or platform/ what a built
// plug-in relies on.
inline constexpr int VXHostInterfaceVersion = 1;

// The resources of a plug-in's bundle. Outlives every object made from the bundle's code. Thread-safe.
class VXBundle {
  public:
    virtual ~VXBundle() = default;

    virtual const std::string& path() const = 0;
    virtual const std::string& identifier() const = 0;
    // The text in the user's language; nil for a key that the bundle lacks.
    virtual std::optional<std::string> localizedString(std::string_view key) const = 0;
    // The image of that name, a new object each time; nil when the bundle has none.
    virtual platform::ImageRef iconNamed(std::string_view name) const = 0;
};
using VXBundleRef = std::shared_ptr<const VXBundle>;

// A principal class: its class operations, and how to make an object of it.
struct VXPrincipalClass {
    bool (*isManagedMediaSource)();
    platform::Array (*supportedPasteboardTypes)();
    double versionNumber;
    const char* versionString;
    // alloc and init in one; nil when the object could not be initialised.
    std::shared_ptr<VXMediaManager> (*newObject)(VXBundleRef bundle);
};

// The type of the exported symbol. Answers nil for a class name that the module does not know.
using VXPluginPrincipalClassFunction = const VXPrincipalClass* (*)(const char* className);
inline constexpr const char* VXPluginPrincipalClassSymbol = "VXPluginPrincipalClass";

}  // namespace vexo
