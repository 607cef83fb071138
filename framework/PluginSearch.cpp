#include "framework/PluginSearch.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/linux/OwnLibrary.h"
#include "platform/linux/UserFolders.h"

namespace vexo {
namespace {

namespace path = platform::path;

std::vector<std::string> splitAtColons(const char* text) {
    std::vector<std::string> parts;
    std::string part;
    for (const char* c = text; c && *c; ++c) {
        if (*c != ':') {
            part += *c;
            continue;
        }
        parts.push_back(std::exchange(part, {}));
    }
    parts.push_back(part);
    std::erase(parts, std::string());
    return parts;
}

void appendBundlesIn(const std::string& folder, std::vector<std::string>& bundles) {
    const platform::FileManager& files = platform::services().fileManager;
    if (!files.fileExistsAtPath(folder))
        return;
    std::vector<std::string> names =
        files.contentsOfDirectoryAtPath(folder).value_or(std::vector<std::string>{});
    std::sort(names.begin(), names.end());  // the same choice on every machine
    for (const std::string& name : names) {
        if (path::extension(name) == "vxplugin")
            bundles.push_back(path::appending(folder, name));
    }
}

}  // namespace

std::vector<std::string> pluginBundles(const std::vector<std::string>& explicitBundles) {
    if (!explicitBundles.empty())
        return explicitBundles;

    std::vector<std::string> bundles;
    for (const std::string& folder : splitAtColons(std::getenv("VEXO_PLUGIN_PATH"))) {
        if (path::extension(folder) == "vxplugin")
            bundles.push_back(folder);
        else
            appendBundlesIn(folder, bundles);
    }

    // A build tree and an installation are told apart by where the library lies.
    const std::string library = platform::ownLibraryFolder();
    const std::string buildTree = path::withoutLastComponent(library);
    if (platform::services().fileManager.fileExistsAtPath(path::appending(buildTree, "CMakeCache.txt")))
        appendBundlesIn(buildTree, bundles);
    if (const auto data = platform::userDataFolder())
        appendBundlesIn(path::appending(*data, "vexo/plugins"), bundles);
    appendBundlesIn(path::appending(library, "vexo/plugins"), bundles);
    return bundles;
}

}  // namespace vexo
