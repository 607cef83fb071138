// The framework's own icons and texts, which are compiled into the library. Callable from any thread.
#pragma once

#include <optional>
#include <string_view>

namespace vexo {

class BundleStrings;

// The bytes of the file of that name, "icons/folder.svg" say; nil when there is none.
std::optional<std::string_view> frameworkResource(std::string_view name);

// The framework's own texts ("DurationString").
const BundleStrings& frameworkStrings();

}  // namespace vexo
