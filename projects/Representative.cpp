// The item that stands for a whole project, and the items of folders of projects.
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"

namespace reelix {

VXReelixPlugin::Object VXReelixPlugin::_representingMediaObjectForProject(const Group& projectGroup) {
    const Object movie = _highestQualityClip(projectGroup->mediaObjects());
    if (!movie)
        return nullptr;
    Object representative = mediaObjectForID(movie->path().value_or(""));
    if (representative)
        representative->setName(projectGroup->name().value_or(""));
    else
        representative = newRepresentative(projectGroup, movie);
    representative->setAttribute(true, vexo::VXReelixProjectRepresentative);
    return representative;
}

VXReelixPlugin::Object VXReelixPlugin::newRepresentative(const Group& projectGroup, const Object& movie) {
    const std::string moviePath = movie->path().value_or("");
    const Object representative =
        newMediaObjectWithType(vexo::VXMediaTypeMovie, projectGroup->name().value_or(""), moviePath);
    representative->setMediaSourceType(vexo::VXMediaSourceTypeFile);
    representative->setPath(moviePath);
    representative->setSpotlightPropertiesOfFile(moviePath);
    if (const auto url = projectGroup->URL())
        representative->setAttribute(url->path(), vexo::VXReelixProjectPathKey);
    const auto resolution = movie->attributeForKey(vexo::VXMediaObjectResolutionKey);
    if (resolution && resolution->size()) {
        representative->setAttribute(*resolution, vexo::VXMediaObjectResolutionKey);
        representative->setAttribute(platform::stringFromSize(*resolution->size()),
                                     vexo::VXMediaObjectResolutionStringKey);
    }
    representative->setAttribute(ReelixProjectFormatVersion, vexo::VXReelixProjectFormatVersion);
    representative->setIcon(movie->thumbnailImage());
    return representative;
}

// A folder collects representatives only. Its list begins empty: a list that was never given would gather the
// rendered movies of the projects instead.
void VXReelixPlugin::_createReelixProjectsFolderMediaObjects(const Group& folderGroup) {
    folderGroup->setMediaObjects({});
    const auto append = [&folderGroup](const Object& mediaObject) {
        folderGroup->setMediaObjects(folderGroup->mediaObjects().appending(mediaObject));
    };
    for (const Group& child : folderGroup->childGroups()) {
        if (isCancelLoadRequestPending())
            return;
        const auto& type = child->typeIdentifier();
        if (type == vexo::VXReelixProjectLibraryGroupTypeIdentifier)
            continue;
        if (type != vexo::VXReelixFolderGroupTypeIdentifier) {
            if (const Object representative = _representingMediaObjectForProject(child))
                append(representative);
            continue;
        }
        for (const Object& mediaObject : child->mediaObjects()) {
            if (isCancelLoadRequestPending())
                break;
            append(mediaObject);
        }
    }
}

}  // namespace reelix
