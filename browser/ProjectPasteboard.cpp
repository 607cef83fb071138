// What a drag of projects says beside the host's own data, so that a receiver can take whole projects with
// all their rendered versions.
//
// No lock is taken: a reload may put another tree in place meanwhile, and what is read stays as it was read.
#include <algorithm>

#include "core/VXReelixPlugin.h"

namespace reelix {
namespace {

constexpr const char* VXReelixProjectsPboardType = "VXReelixProjectsPboardType";

using vexo::VXMediaGroupRef;
using vexo::VXMediaObject;
using vexo::VXMediaObjectRef;

bool isProject(const VXMediaGroupRef& group) {
    return group->typeIdentifier() == vexo::VXReelixProjectGroupTypeIdentifier;
}

// A project of several movies goes to other programs as its first one: in folder order, not the best.
VXMediaGroupRef groupForOtherPrograms(const VXMediaGroupRef& group) {
    const vexo::VXMediaObjectList movies = group->mediaObjects();
    if (!isProject(group) || movies.size() < 2)
        return group;
    const VXMediaGroupRef copy = group->copy();
    copy->setMediaObjects({movies[0]});
    return copy;
}

// nil without a path.
std::optional<platform::Dictionary> renderedVersion(const VXMediaObject& movie) {
    auto path = movie.aliasResolvedPath();
    if (!path)
        return std::nullopt;
    platform::Dictionary version{{"Path", *std::move(path)}, {"Name", movie.name()}};
    const auto resolution = movie.attributeForKey(vexo::VXMediaObjectResolutionKey);
    if (resolution && resolution->size())
        version.insert_or_assign("Dimensions", platform::stringFromSize(*resolution->size()));
    if (auto duration = movie.attributeForKey(vexo::VXMediaObjectDurationKey))
        version.insert_or_assign("Duration", *std::move(duration));
    return version;
}

platform::Array renderedVersions(const VXMediaGroupRef& project) {
    platform::Array versions;
    for (const VXMediaObjectRef& movie : project->mediaObjects()) {
        if (auto version = renderedVersion(*movie))
            versions.emplace_back(*std::move(version));
    }
    return versions;
}

// nil for a project that has no path or no movie to offer.
std::optional<platform::Dictionary> projectDictionary(const VXMediaGroupRef& project) {
    platform::Array versions = renderedVersions(project);
    const auto url = project->URL();
    if (!url || versions.empty())
        return std::nullopt;
    platform::Dictionary dictionary{{"RenderedVersions", std::move(versions)}, {"ProjectPath", url->path()}};
    if (auto name = project->name())
        dictionary.insert_or_assign("ProjectName", *std::move(name));
    return dictionary;
}

}  // namespace

platform::Array VXReelixPlugin::supportedPasteboardTypes() {
    const platform::Array types{platform::Value(VXReelixProjectsPboardType)};
    return platform::Array{platform::Value(types)};
}

bool VXReelixPlugin::writeMediaGroups(const Groups& mediaGroups, platform::Pasteboard& toPasteboard) {
    Groups forOtherPrograms;
    Groups projects;
    for (const Group& group : mediaGroups) {
        forOtherPrograms.push_back(groupForOtherPrograms(group));
        if (isProject(group))
            projects.push_back(group);
    }
    const bool wrote = VXMediaManager::writeMediaGroups(forOtherPrograms, toPasteboard);
    if (projects.empty())
        return wrote;
    writeProjects(projects, toPasteboard);
    return true;
}

bool VXReelixPlugin::writeMediaObjects(const Objects& mediaObjects, platform::Pasteboard& toPasteboard) {
    const bool wrote = VXMediaManager::writeMediaObjects(mediaObjects, toPasteboard);
    std::vector<std::string> projectPaths;
    for (const Object& mediaObject : mediaObjects) {
        const auto path = mediaObject->attributeForKey(vexo::VXReelixProjectPathKey);
        if (path && path->string())
            projectPaths.push_back(*path->string());
    }
    if (projectPaths.empty())
        return wrote;
    writeProjects(projectGroupsForPaths(projectPaths), toPasteboard);
    return true;
}

void VXReelixPlugin::writeProjects(const Groups& projects, platform::Pasteboard& toPasteboard) {
    toPasteboard.addTypes({VXReelixProjectsPboardType}, this);
    toPasteboard.setPropertyList(dictionaryWithProjects(projects), VXReelixProjectsPboardType);
}

VXReelixPlugin::Groups VXReelixPlugin::projectGroupsForPaths(const std::vector<std::string>& paths) {
    Groups results;
    projectGroupsForPaths(paths, rootMediaGroup(), results);
    return results;
}

void VXReelixPlugin::projectGroupsForPaths(const std::vector<std::string>& paths, const Group& currentGroup,
                                           Groups& resultsArray) {
    if (!currentGroup)
        return;
    const vexo::VXMediaGroupList childGroups = currentGroup->childGroups();
    if (isProject(currentGroup)) {
        const auto url = currentGroup->URL();
        const auto times = url ? std::count(paths.begin(), paths.end(), url->path()) : 0;
        resultsArray.insert(resultsArray.end(), static_cast<std::size_t>(times), currentGroup);
    }
    for (const Group& child : childGroups)
        projectGroupsForPaths(paths, child, resultsArray);
}

platform::Dictionary VXReelixPlugin::dictionaryWithProjects(const Groups& projects) {
    platform::Array projectList;
    for (const Group& project : projects) {
        if (auto dictionary = projectDictionary(project))
            projectList.emplace_back(*std::move(dictionary));
    }
    if (projectList.empty())
        return {};
    return {{"ProjectList", std::move(projectList)}};
}

}  // namespace reelix
