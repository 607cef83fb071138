// The framework's own icons and texts, which are compiled into the library. Callable from any thread.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "platform/Image.h"

namespace vexo {

class BundleStrings;

// The bytes of the file of that name, "icons/folder.svg" say; nil when there is none.
std::optional<std::string_view> frameworkResource(std::string_view name);

// A new image of the framework's icon of that name, "folder" say. Requires: there is one.
platform::ImageRef frameworkIcon(const std::string& name);

// The framework's own texts ("DurationString").
const BundleStrings& frameworkStrings();

}  // namespace vexo
