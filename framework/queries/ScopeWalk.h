// What lies below the folders of a query's scope, as real paths. Callable from any thread.
//
// Items are files, folders, and packages, each of these one item with all that is in it. Hidden items are no
// items, nor is what lies in them, and folders that can't be listed are passed over. A symbolic link is an
// item and never entered, so no walk goes in circles. A folder that one begins at may be anything: hidden, a
// package, a link.
#pragma once

#include <atomic>
#include <functional>
#include <optional>
#include <string>

namespace vexo {

enum class ScopeItem { none, document, folder };

// What there is at a real path: none where nothing is or it is hidden, and a document for all that is not
// entered.
ScopeItem scopeItemAtPath(const std::string& path);

// Passes every item below a folder to `visit`, until `cancelled`, which is tested before each.
void visitItemsBelow(const std::string& folder, const std::atomic<bool>& cancelled,
                     const std::function<void(const std::string& path)>& visit);

// The item by which a walk from `folder` gets to know of `path` below it: itself, else the first one above it
// that is not entered, or is not there.
std::string itemOfWalk(const std::string& folder, const std::string& path);

// The path by which the system knows it, with no more slashes than it needs; nil for one that is not
// absolute, or on a volume that is not mounted.
std::optional<std::string> realScopePath(const std::string& path);

// Both as `realScopePath` makes them.
bool isBelow(const std::string& path, const std::string& folder);
inline bool isAtOrBelow(const std::string& path, const std::string& folder) {
    return path == folder || isBelow(path, folder);
}

}  // namespace vexo
