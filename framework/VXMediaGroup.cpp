#include "host/VXMediaGroup.h"

#include <vector>

#include "platform/FileManager.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

VXMediaGroup::VXMediaGroup(const VXGroupTypeIdentifier& typeIdentifier, std::optional<std::string> groupID)
    : ID_(std::move(groupID)) {
    fields_.typeIdentifier = &typeIdentifier;
}

std::optional<std::string> VXMediaGroup::name() const {
    Locked lock(mutex_);
    return fields_.name;
}

void VXMediaGroup::setName(std::optional<std::string> name) {
    Locked lock(mutex_);
    fields_.name = std::move(name);
}

const VXGroupTypeIdentifier& VXMediaGroup::typeIdentifier() const {
    Locked lock(mutex_);
    return *fields_.typeIdentifier;
}

void VXMediaGroup::setTypeIdentifier(const VXGroupTypeIdentifier& typeIdentifier) {
    Locked lock(mutex_);
    fields_.typeIdentifier = &typeIdentifier;
}

std::optional<std::string> VXMediaGroup::parentID() const {
    Locked lock(mutex_);
    return fields_.parentID;
}

void VXMediaGroup::setParentID(std::optional<std::string> parentID) {
    Locked lock(mutex_);
    fields_.parentID = std::move(parentID);
}

platform::ImageRef VXMediaGroup::icon() const {
    Locked lock(mutex_);
    return fields_.icon;
}

void VXMediaGroup::setIcon(platform::ImageRef icon) {
    Locked lock(mutex_);
    fields_.icon = std::move(icon);
}

VXMediaGroupList VXMediaGroup::childGroups() const {
    Locked lock(mutex_);
    return fields_.childGroups;
}

void VXMediaGroup::setChildGroups(VXMediaGroupList childGroups) {
    Locked lock(mutex_);
    fields_.childGroups.swap(childGroups);
}

void VXMediaGroup::addChildGroup(const VXMediaGroupRef& childGroup) {
    if (!childGroup)
        return;
    Locked lock(mutex_);
    fields_.childGroups = fields_.childGroups.appending(childGroup);
}

void VXMediaGroup::addChildGroups(const VXMediaGroupList& childGroups) {
    for (const VXMediaGroupRef& childGroup : childGroups)
        addChildGroup(childGroup);
}

VXMediaObjectList VXMediaGroup::mediaObjects() const {
    if (std::optional<VXMediaObjectList> own = ownMediaObjects())
        return *own;
    std::vector<VXMediaObjectList> lists;
    addListsOfChildren(lists);
    return VXMediaObjectList::joining(lists);
}

std::size_t VXMediaGroup::mediaObjectCount() const {
    if (const std::optional<VXMediaObjectList> own = ownMediaObjects())
        return own->size();
    std::size_t count = 0;
    for (const VXMediaGroupRef& childGroup : childGroups())
        count += childGroup->mediaObjectCount();
    return count;
}

void VXMediaGroup::addListsOfChildren(std::vector<VXMediaObjectList>& lists) const {
    for (const VXMediaGroupRef& childGroup : childGroups()) {
        if (std::optional<VXMediaObjectList> own = childGroup->ownMediaObjects())
            lists.push_back(std::move(*own));
        else
            childGroup->addListsOfChildren(lists);
    }
}

void VXMediaGroup::setMediaObjects(VXMediaObjectList mediaObjects) {
    std::optional<VXMediaObjectList> replaced = std::move(mediaObjects);
    Locked lock(mutex_);
    fields_.mediaObjects.swap(replaced);
}

std::optional<VXMediaObjectList> VXMediaGroup::ownMediaObjects() const {
    Locked lock(mutex_);
    return fields_.mediaObjects;
}

bool VXMediaGroup::dynamicMediaObjects() const {
    Locked lock(mutex_);
    return fields_.dynamicMediaObjects;
}

void VXMediaGroup::setDynamicMediaObjects(bool dynamic) {
    Locked lock(mutex_);
    fields_.dynamicMediaObjects = dynamic;
}

std::shared_ptr<const platform::Dictionary> VXMediaGroup::attributes() const {
    static const auto none = std::make_shared<const platform::Dictionary>();
    Locked lock(mutex_);
    return fields_.attributes ? fields_.attributes : none;
}

void VXMediaGroup::setAttributes(platform::Dictionary attributes) {
    auto shared = std::make_shared<const platform::Dictionary>(std::move(attributes));
    Locked lock(mutex_);
    fields_.attributes.swap(shared);
}

platform::DateRef VXMediaGroup::modDateForFile(const std::string& path) {
    const auto attributes = platform::services().fileManager.attributesOfItemAtPath(path);
    return attributes ? attributes->modificationDate : nullptr;
}

platform::DateRef VXMediaGroup::modificationDate() const {
    Locked lock(mutex_);
    return fields_.modificationDate;
}

void VXMediaGroup::setModificationDate(platform::DateRef date) {
    Locked lock(mutex_);
    fields_.modificationDate = std::move(date);
}

std::optional<std::string> VXMediaGroup::path() const {
    Locked lock(mutex_);
    return fields_.path;
}

void VXMediaGroup::setPath(std::string path) {
    Locked lock(mutex_);
    fields_.path = std::move(path);
}

std::optional<platform::URL> VXMediaGroup::URL() const {
    std::optional<std::string> groupPath = path();
    if (!groupPath)
        return std::nullopt;
    return platform::URL::fileURLWithPath(std::move(*groupPath));
}

VXMediaGroupRef VXMediaGroup::copy() const {
    Locked lock(mutex_);
    auto duplicate = std::make_shared<VXMediaGroup>(*fields_.typeIdentifier, ID_);
    Locked duplicateLock(duplicate->mutex_);
    duplicate->fields_ = fields_;
    return duplicate;
}

}  // namespace vexo
