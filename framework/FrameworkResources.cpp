#include "framework/FrameworkResources.h"

#include "framework/BundleStrings.h"

namespace vexo {

const BundleStrings& frameworkStrings() {
    static const auto strings = BundleStrings::withData(*frameworkResource("Strings.ini"), "Strings.ini");
    return strings;
}

}  // namespace vexo
