// Turns one folder of projects into a tree of groups.
#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "host/VXMediaBrowserImageManager.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace reelix {
namespace {

namespace path = platform::path;

constexpr std::string_view projectExtension = "qnproject";

struct Item {
    std::string path;
    std::uint32_t flags;
};

struct FolderContent {
    std::string folder;  // the folder that was listed
    std::vector<Item> items;
};

// What may be seen in a folder; nil when it can't be listed. An item whose flags can't be had is skipped.
std::optional<std::vector<Item>> visibleItems(const std::string& path) {
    const auto folder = platform::services().fileManager.openFolderAtPath(path);
    const auto listed = folder ? folder->allItems() : std::nullopt;
    if (!listed)
        return std::nullopt;
    std::vector<Item> items;
    for (const platform::FolderItem& item : *listed) {
        if (item.name.empty() || item.name.front() == '.')
            continue;
        const std::uint32_t flags = folder->flagsOf(item).value_or(platform::itemIsInvisible);
        if (!(flags & platform::itemIsInvisible))
            items.push_back({path::appending(path, item.name), flags});
    }
    return items;
}

// A folder whose localized form can't be listed is read by its plain name. An unlistable one has no items.
FolderContent contentOf(const std::string& folder) {
    if (auto items = visibleItems(folder))
        return {folder, std::move(*items)};
    if (path::extension(folder) != ReelixLocalizedExtension)
        return {folder, {}};
    std::string plain = path::withoutExtension(folder);
    auto items = visibleItems(plain).value_or(std::vector<Item>{});
    return {std::move(plain), std::move(items)};
}

void setFileFields(const vexo::VXMediaGroupRef& group, const std::string& file) {
    group->setName(path::lastComponent(file));
    group->setModificationDate(vexo::VXMediaGroup::modDateForFile(file));
    group->setPath(file);
}

// A project without movies never shares its icon object with a finished one.
platform::ImageRef projectIcon(bool hasMovies, bool isTrailer) {
    const IconCache& icons = iconCache();
    if (hasMovies)
        return (isTrailer ? icons.trailerIcon : icons.projectIcon).get();
    return (isTrailer ? icons.spareTrailerIcon : icons.spareProjectIcon).get();
}

}  // namespace

VXReelixPlugin::Group VXReelixPlugin::_createReelixProjectsFolderForPath(
    const std::optional<std::string>& path) {
    if (!path)
        return nullptr;
    const Group folderGroup = newMediaGroupWithTypeIdentifier(vexo::VXReelixFolderGroupTypeIdentifier, *path);
    setFileFields(folderGroup, *path);
    folderGroup->setParentID(path::withoutLastComponent(*path));
    folderGroup->setIcon(vexo::VXMediaBrowserImageManager::sharedInstance().iconForFile(*path));

    const FolderContent content = contentOf(*path);
    for (const auto& [item, flags] : content.items) {
        if (flags & platform::itemIsPackage) {
            if (path::extension(item) == projectExtension)
                folderGroup->addChildGroup(projectGroupForPackage(item, content.folder));
        } else if (flags & platform::itemIsContainer) {
            const Group subfolder = _createReelixProjectsFolderForPath(item);
            subfolder->setParentID(folderGroup->ID());
            folderGroup->addChildGroup(subfolder);
        }
    }

    if (folderGroup->childGroups().empty())
        _flatProjectGroupsList->push_back(placeholderGroupForFolder(content.folder));
    _createReelixProjectsFolderMediaObjects(folderGroup);
    return folderGroup;
}

VXReelixPlugin::Group VXReelixPlugin::projectGroupForPackage(const std::string& package,
                                                             const std::string& folder) {
    const Group project = newMediaGroupWithTypeIdentifier(vexo::VXReelixProjectGroupTypeIdentifier, package);
    setFileFields(project, package);
    project->setName(path::withoutExtension(path::lastComponent(package)));
    project->setParentID(folder);
    _flatProjectGroupsList->push_back(project);

    const std::vector<std::string> movies = _renderedMoviesPathsForProjectPath(package);
    for (const std::string& movie : movies)
        project->setMediaObjects(project->mediaObjects().appending(renderedMovieObject(movie, package)));
    project->setIcon(projectIcon(/*hasMovies=*/!movies.empty(), _isTrailer(package)));
    return project;
}

// Makes an empty library known through the flat list; it is attached to nothing in the tree.
VXReelixPlugin::Group VXReelixPlugin::placeholderGroupForFolder(const std::string& folder) {
    const bool isDefault = folder == _ReelixDefaultPath() || folder == _ReelixDefaultPath2();
    const Group placeholder = newMediaGroupWithTypeIdentifier(
        isDefault ? vexo::VXReelixProjectLibraryGroupTypeIdentifier : vexo::VXReelixFolderGroupTypeIdentifier,
        folder);
    setFileFields(placeholder, folder);
    placeholder->setParentID(folder);
    placeholder->setIcon(vexo::VXMediaBrowserImageManager::sharedInstance().iconForFile(folder));
    return placeholder;
}

VXReelixPlugin::Object VXReelixPlugin::renderedMovieObject(const std::string& movie,
                                                           const std::string& package) {
    const Object object = newMediaObjectWithType(vexo::VXMediaTypeMovie,
                                                 path::withoutExtension(path::lastComponent(movie)), movie);
    object->setMediaSourceType(vexo::VXMediaSourceTypeFile);
    object->setPath(movie);
    object->setSpotlightPropertiesOfFile(movie);
    object->setAttribute(package, vexo::VXReelixProjectPathKey);
    object->setAttribute(ReelixProjectFormatVersion, vexo::VXReelixProjectFormatVersion);
    object->setIcon(iconCache().smallApplicationIcon.get());
    return object;
}

}  // namespace reelix
