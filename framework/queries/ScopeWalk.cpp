#include "framework/queries/ScopeWalk.h"

#include <vector>

#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace vexo {
namespace {

const platform::FileManager& files() {
    return platform::services().fileManager;
}

// The folder with the one slash that follows it in the paths of what it holds.
std::string prefixOf(const std::string& folder) {
    return folder.ends_with('/') ? folder : folder + "/";
}

}  // namespace

ScopeItem scopeItemAtPath(const std::string& path) {
    const auto flags = files().itemFlagsAtPath(path);
    if (!flags || *flags & platform::itemIsInvisible)
        return ScopeItem::none;
    const bool isEntered = (*flags & platform::itemIsContainer) && !(*flags & platform::itemIsPackage);
    return isEntered ? ScopeItem::folder : ScopeItem::document;
}

void visitItemsBelow(const std::string& folder, const std::atomic<bool>& cancelled,
                     const std::function<void(const std::string& path)>& visit) {
    // A list of our own: a tree may be as deep as a path can be long.
    std::vector<std::string> pending{folder};
    while (!pending.empty()) {
        const std::string current = std::move(pending.back());
        pending.pop_back();
        const auto names = files().contentsOfDirectoryAtPath(current);
        for (const std::string& name : names.value_or(std::vector<std::string>())) {
            if (cancelled)
                return;
            const std::string path = platform::path::appending(current, name);
            const ScopeItem item = scopeItemAtPath(path);
            if (item == ScopeItem::none)
                continue;
            visit(path);
            if (item == ScopeItem::folder)
                pending.push_back(path);
        }
    }
}

std::string itemOfWalk(const std::string& folder, const std::string& path) {
    for (std::size_t end = prefixOf(folder).size(); (end = path.find('/', end)) != path.npos; ++end) {
        const std::string above = path.substr(0, end);
        if (scopeItemAtPath(above) != ScopeItem::folder)
            return above;
    }
    return path;
}

std::optional<std::string> realScopePath(const std::string& path) {
    const auto resolved = files().resolvedPath(path);
    if (!resolved || !resolved->starts_with('/'))
        return std::nullopt;
    std::string real;
    for (const std::string& component : platform::path::components(*resolved))
        real = platform::path::appending(real, component);
    return real;
}

bool isBelow(const std::string& path, const std::string& folder) {
    const std::string prefix = prefixOf(folder);
    return path.size() > prefix.size() && path.starts_with(prefix);
}

}  // namespace vexo
