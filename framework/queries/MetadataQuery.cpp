#include "framework/queries/MetadataQuery.h"

#include <sys/stat.h>

#include <algorithm>

#include "framework/queries/ScopeWalk.h"
#include "platform/Path.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {
namespace {

using platform::Locked;

// The entries of `a` that `b` lacks.
std::set<std::string> without(const std::set<std::string>& a, const std::set<std::string>& b) {
    std::set<std::string> rest;
    std::set_difference(a.begin(), a.end(), b.begin(), b.end(), std::inserter(rest, rest.end()));
    return rest;
}

bool hasFolderAbove(const std::set<std::string>& paths, const std::string& path) {
    for (std::string above = path; above != "/";) {
        above = platform::path::withoutLastComponent(above);
        if (paths.contains(above))
            return true;
    }
    return false;
}

}  // namespace

MetadataQuery::MetadataQuery(QueryExpression expression, VXPathListRef scope,
                             const MetadataProvider& metadata)
    : expression_(std::move(expression)), metadata_(metadata), scope_(std::move(scope)) {}

void MetadataQuery::setScope(VXPathListRef scope) {
    Locked lock(mutex_);
    scope_ = std::move(scope);
}

VXPathListRef MetadataQuery::scope() const {
    Locked lock(mutex_);
    return scope_;
}

std::vector<std::string> MetadataQuery::results() const {
    std::vector<std::string> paths;
    for (const auto& [path, state] : currentResults())
        paths.push_back(path);
    return paths;
}

bool MetadataQuery::gather(const platform::Date& now) {
    update({"/"}, now);
    return !cancelled_;
}

QueryChange MetadataQuery::update(const std::vector<std::string>& changedPaths, const platform::Date& now) {
    Locked working(working_);
    const Paths folders = scopeFolders();
    const Paths touched = affectedPaths(changedPaths, folders);
    Paths affected = touched;
    affected.merge(without(folders, knownFolders_));
    affected.merge(without(knownFolders_, folders));

    const Results before = currentResults();
    Results after = before;
    for (const std::string& path : affected) {
        if (!hasFolderAbove(affected, path))
            lookAgain(path, folders, now, after);
    }
    if (cancelled_)
        return {};
    knownFolders_ = folders;
    QueryChange change = difference(before, after, touched);
    Locked lock(mutex_);
    results_ = std::move(after);
    return change;
}

MetadataQuery::Results MetadataQuery::currentResults() const {
    Locked lock(mutex_);
    return results_;
}

MetadataQuery::Paths MetadataQuery::scopeFolders() const {
    Paths folders;
    const VXPathListRef scope = this->scope();
    for (const std::string& folder : scope ? scope->snapshot() : std::vector<std::string>()) {
        if (const auto real = realScopePath(folder))
            folders.insert(*real);
    }
    return folders;
}

// The items and folders that the paths are about.
MetadataQuery::Paths MetadataQuery::affectedPaths(const std::vector<std::string>& changedPaths,
                                                  const Paths& folders) {
    Paths affected;
    for (const std::string& changed : changedPaths) {
        const auto path = realScopePath(changed);
        for (const std::string& folder : path ? folders : Paths()) {
            if (isAtOrBelow(folder, *path))
                affected.insert(folder);
            else if (isBelow(*path, folder))
                affected.insert(itemOfWalk(folder, *path));
        }
    }
    return affected;
}

// Replaces the results at and below a path by what is there now.
void MetadataQuery::lookAgain(const std::string& path, const Paths& folders, const platform::Date& now,
                              Results& results) const {
    std::erase_if(results, [&](const auto& result) { return isAtOrBelow(result.first, path); });
    for (const std::string& folder : folders) {
        if (isAtOrBelow(folder, path))
            visitItemsBelow(folder, cancelled_, [&](const auto& item) { lookAt(item, now, results); });
        else if (isBelow(path, folder) && itemOfWalk(folder, path) == path)
            lookAtTree(path, now, results);
    }
}

void MetadataQuery::lookAtTree(const std::string& path, const platform::Date& now, Results& results) const {
    const ScopeItem item = scopeItemAtPath(path);
    if (item != ScopeItem::none)
        lookAt(path, now, results);
    if (item == ScopeItem::folder)
        visitItemsBelow(path, cancelled_, [&](const auto& below) { lookAt(below, now, results); });
}

void MetadataQuery::lookAt(const std::string& path, const platform::Date& now, Results& results) const {
    if (!expression_.matches(*metadata_.propertiesForFile(path), now))
        return;
    if (const auto state = stateOf(path))
        results.emplace(path, *state);
}

// nil for what is gone, and for links that lead nowhere.
std::optional<MetadataQuery::FileState> MetadataQuery::stateOf(const std::string& path) {
    struct stat status;
    if (platform::uninterrupted([&] { return stat(path.c_str(), &status); }) != 0)
        return std::nullopt;
    return FileState{status.st_dev, status.st_ino, status.st_size, status.st_mtim.tv_sec,
                     status.st_mtim.tv_nsec};
}

QueryChange MetadataQuery::difference(const Results& before, const Results& after, const Paths& touched) {
    QueryChange change;
    for (const auto& [path, state] : after) {
        const auto found = before.find(path);
        if (found == before.end())
            change.added.push_back(path);
        else if (found->second != state || touched.contains(path))
            change.changed.push_back(path);
    }
    for (const auto& [path, state] : before) {
        if (!after.contains(path))
            change.removed.push_back(path);
    }
    return change;
}

}  // namespace vexo
