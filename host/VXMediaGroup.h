// One node of a tree of media: a library, a folder, a project, a year, an event.
//
// Groups have identity and are shared. Every operation is callable from any thread: children, items and
// attributes are answered as snapshots that a later change leaves as they are.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/VXConstants.h"
#include "host/VXMediaObject.h"
#include "platform/Date.h"
#include "platform/Image.h"
#include "platform/SnapshotList.h"
#include "platform/ThreadSafety.h"
#include "platform/URL.h"
#include "platform/Value.h"

namespace vexo {

class VXMediaGroup;
using VXMediaGroupRef = std::shared_ptr<VXMediaGroup>;
using VXMediaGroupList = platform::SnapshotList<VXMediaGroupRef>;

class VXMediaGroup final {
  public:
    // Groups are made by VXMediaManager::newMediaGroupWithTypeIdentifier, nothing else needs this.
    VXMediaGroup(const VXGroupTypeIdentifier& typeIdentifier, std::optional<std::string> groupID);

    const std::optional<std::string>& ID() const { return ID_; }

    std::optional<std::string> name() const VX_EXCLUDES(mutex_);
    void setName(std::optional<std::string> name) VX_EXCLUDES(mutex_);
    const VXGroupTypeIdentifier& typeIdentifier() const VX_EXCLUDES(mutex_);
    void setTypeIdentifier(const VXGroupTypeIdentifier& typeIdentifier) VX_EXCLUDES(mutex_);
    std::optional<std::string> parentID() const VX_EXCLUDES(mutex_);
    void setParentID(std::optional<std::string> parentID) VX_EXCLUDES(mutex_);
    platform::ImageRef icon() const VX_EXCLUDES(mutex_);
    void setIcon(platform::ImageRef icon) VX_EXCLUDES(mutex_);

    VXMediaGroupList childGroups() const VX_EXCLUDES(mutex_);
    void setChildGroups(VXMediaGroupList childGroups) VX_EXCLUDES(mutex_);
    // Appends one group in amortised constant time; nil leaves the children unchanged.
    void addChildGroup(const VXMediaGroupRef& childGroup) VX_EXCLUDES(mutex_);
    void addChildGroups(const VXMediaGroupList& childGroups) VX_EXCLUDES(mutex_);

    // The items of the group. A group that was never given any reports those of its children, gathered in
    // order; one that was given a list, even an empty one, reports that list.
    VXMediaObjectList mediaObjects() const VX_EXCLUDES(mutex_);
    // How many these are, without a list of them all.
    std::size_t mediaObjectCount() const VX_EXCLUDES(mutex_);
    void setMediaObjects(VXMediaObjectList mediaObjects) VX_EXCLUDES(mutex_);
    // The list the group was given; nil when it was given none.
    std::optional<VXMediaObjectList> ownMediaObjects() const VX_EXCLUDES(mutex_);
    // Whether the host is to ask for the items each time instead of once.
    bool dynamicMediaObjects() const VX_EXCLUDES(mutex_);
    void setDynamicMediaObjects(bool dynamic) VX_EXCLUDES(mutex_);

    // Never nil.
    std::shared_ptr<const platform::Dictionary> attributes() const VX_EXCLUDES(mutex_);
    void setAttributes(platform::Dictionary attributes) VX_EXCLUDES(mutex_);
    // The date to store with setModificationDate for a file; nil when it can't be read.
    static platform::DateRef modDateForFile(const std::string& path);
    platform::DateRef modificationDate() const VX_EXCLUDES(mutex_);
    void setModificationDate(platform::DateRef date) VX_EXCLUDES(mutex_);
    std::optional<std::string> path() const VX_EXCLUDES(mutex_);
    void setPath(std::string path) VX_EXCLUDES(mutex_);
    std::optional<platform::URL> URL() const;  // of the path; nil without one

    // A new group with the same fields. Its lists can be replaced without touching this group's.
    VXMediaGroupRef copy() const VX_EXCLUDES(mutex_);

  private:
    void addListsOfChildren(std::vector<VXMediaObjectList>& lists) const VX_EXCLUDES(mutex_);

    // Everything a copy shares with its original.
    struct Fields {
        std::optional<std::string> name;
        const VXGroupTypeIdentifier* typeIdentifier;
        std::optional<std::string> parentID;
        std::optional<std::string> path;
        platform::ImageRef icon;
        platform::DateRef modificationDate;
        VXMediaGroupList childGroups;
        std::optional<VXMediaObjectList> mediaObjects;
        std::shared_ptr<const platform::Dictionary> attributes;  // nil until set
        bool dynamicMediaObjects = false;
    };

    const std::optional<std::string> ID_;
    mutable platform::Mutex mutex_;
    Fields fields_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
