#include "framework/FrameworkResources.h"

#include <span>

#include "framework/BundleStrings.h"

namespace vexo {

platform::ImageRef frameworkIcon(const std::string& name) {
    const std::string_view svg = *frameworkResource("icons/" + name + ".svg");
    return std::make_shared<platform::Image>(platform::pictureWithData(std::as_bytes(std::span(svg))), name);
}

const BundleStrings& frameworkStrings() {
    static const auto strings = BundleStrings::withData(*frameworkResource("Strings.ini"), "Strings.ini");
    return strings;
}

}  // namespace vexo
