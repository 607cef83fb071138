// The base class of every media plug-in: owns the root group of the plug-in's tree, the load thread on which
// the plug-in builds it, the request to stop a long load, and the table of items by ID.
//
// Made and destroyed by the host. loadData, menus, pasteboard and overlays are called on the main thread;
// performLoadData on the load thread; the observer operations on any thread. Everything that a plug-in sends
// to itself is callable from any thread.
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/VXMediaGroup.h"
#include "host/VXMediaObject.h"
#include "host/VXPathWatcher.h"
#include "host/VXPlugin.h"
#include "platform/Image.h"
#include "platform/Menu.h"
#include "platform/Pasteboard.h"

namespace vexo {

// Marks a class as a plug-in's principal class. Declares nothing.
class VXMediaManagerPlugin_MustImplement {
  protected:
    ~VXMediaManagerPlugin_MustImplement() = default;
};

// Folders that a plug-in looks at for libraries, in order, duplicates kept.
struct VXLibraryLocations {
    std::string kind;  // "projects", "events"
    std::vector<std::string> paths;
};

class VXMediaManager : public VXPathObserver, public std::enable_shared_from_this<VXMediaManager> {
  public:
    explicit VXMediaManager(VXBundleRef bundle);
    ~VXMediaManager() override;
    VXMediaManager(const VXMediaManager&) = delete;
    VXMediaManager& operator=(const VXMediaManager&) = delete;

    // The object itself when it may be used, else nil. Called once, right after construction, when a
    // std::shared_ptr owns the object. An override calls the base first and gives up when that answers nil.
    virtual VXMediaManager* init();

    // --- What the host asks of a plug-in -------------------------------------------------------------------

    virtual std::string rootMediaGroupTitle() = 0;
    virtual platform::ImageRef rootMediaGroupIcon() = 0;  // 16 x 16; nil when there is none
    virtual unsigned mediaTypesSupported() = 0;           // a mask, VXMediaTypeMaskMovie
    virtual std::string uniqueID() = 0;
    virtual std::string displayName() = 0;          // deprecated, use rootMediaGroupTitle
    virtual platform::ImageRef displayImage() = 0;  // deprecated, use rootMediaGroupIcon

    // Flat lists of groups, without their order in the tree.
    virtual std::vector<VXMediaGroupRef> mediaGroups() = 0;

    virtual bool canLoadData() = 0;
    virtual bool appInstalled() = 0;
    virtual std::optional<std::string> defaultLoadingMessage() = 0;
    // defaultNoDataMessage:; nil when the group needs no message.
    virtual std::optional<std::string> defaultNoDataMessage(const VXMediaGroupRef& group) = 0;

    // Called for every request to load or reload; an override calls the base last. The base starts a load on
    // the load thread, or has the load in progress followed by another.
    virtual void loadData();
    // Builds the tree and answers its root. May raise: the last good tree then stays.
    virtual VXMediaGroupRef performLoadData() = 0;

    // Where the plug-in looks for libraries; empty before the first load.
    virtual std::vector<VXLibraryLocations> libraryLocations() { return {}; }

    // contextMenuForMediaObject:inMediaGroup: and contextMenuForMediaGroup:; nil for no menu, as the base
    // answers.
    virtual std::shared_ptr<platform::Menu> contextMenuForMediaObject(const VXMediaObjectRef& mediaObject,
                                                                      const VXMediaGroupRef& inMediaGroup);
    virtual std::shared_ptr<platform::Menu> contextMenuForMediaGroup(const VXMediaGroupRef& mediaGroup);

    // writeMediaGroups:toPasteboard: and writeMediaObjects:toPasteboard:; whether anything was written. The
    // base writes the files as "text/uri-list", "x-special/gnome-copied-files" and "text/plain", with the
    // paths that other programs know them by.
    virtual bool writeMediaGroups(const std::vector<VXMediaGroupRef>& mediaGroups,
                                  platform::Pasteboard& toPasteboard);
    virtual bool writeMediaObjects(const std::vector<VXMediaObjectRef>& mediaObjects,
                                   platform::Pasteboard& toPasteboard);

    // thumbnailOverlayForMediaObject:inMediaGroups:atSize:; an image of that size in points to draw over the
    // item's thumbnail, nil for none. The base answers a badge with the item's duration, where that is known
    // and there is room for it.
    virtual platform::ImageRef thumbnailOverlayForMediaObject(
        const VXMediaObjectRef& mediaObject, const std::vector<VXMediaGroupRef>& inMediaGroups,
        platform::Size atSize);

    // Changes of watched paths and queries; the base ignores them.
    void watchedPathChanged(const std::string& path, std::uint64_t fileChangedEventFlags) override;
    void watchedQueryChanged(const platform::Notification& notification,
                             const VXPathListRef& queryScope) override;

    // --- What a plug-in asks of its host -------------------------------------------------------------------

    // YES until the first request to load has reached the base.
    bool firstTimeCallingLoadData() const;
    // Whether the tree is out of date; a host with automatic reload then calls loadData by itself.
    bool needsReload() const;
    void setNeedsReload(bool needsReload);
    bool autoReloadEnabled() const;
    void setAutoReloadEnabled(bool enabled);
    double loadThreadPriority() const;
    void setLoadThreadPriority(double priority);  // 0.0 to 1.0
    bool isLoading() const;
    // Whether the host asks the current load to stop. Virtual so that tests can raise it at a chosen element.
    virtual bool isCancelLoadRequestPending() const;

    VXMediaGroupRef rootMediaGroup() const;  // nil before the first load
    // Installs a tree: registers its items by ID and tells the host's observers to redisplay. Passing the
    // current root again after changing it in place publishes the change.
    void setRootMediaGroup(VXMediaGroupRef group);

    // newMediaGroupWithTypeIdentifier:groupID:
    VXMediaGroupRef newMediaGroupWithTypeIdentifier(const VXGroupTypeIdentifier& typeIdentifier,
                                                    std::optional<std::string> groupID);
    // newMediaObjectWithType:name:objectID:; the item is found by its ID once a tree that holds it is
    // installed.
    VXMediaObjectRef newMediaObjectWithType(int mediaType, std::string name, std::string objectID);
    // mediaObjectForID:; the item of the installed tree with that ID, the first of several; nil when there is
    // none. The first question after a tree was installed goes through all of it.
    VXMediaObjectRef mediaObjectForID(const std::string& ID) const;

    // localizedString:; nil for a key that the bundle lacks.
    std::optional<std::string> localizedString(std::string_view key) const;
    // iconNamed:; an image of the caller's own; nil for a name that the bundle lacks.
    platform::ImageRef iconNamed(std::string_view name) const;

    // --- What a host program does with a plug-in -----------------------------------------------------------

    // Told when a tree was installed or republished, on the thread that did it, outside every lock.
    using TreeObserver = std::function<void(const VXMediaGroupRef& root)>;
    void addTreeObserver(std::weak_ptr<const void> observer, TreeObserver handler);

    // Asks the load in progress to stop; what it answers is dropped and the last tree stays.
    void cancelLoad();
    // Waits until no load is in progress, `atMost` as long. Answers whether that is so.
    bool waitUntilLoaded(std::chrono::nanoseconds atMost) const;
    void waitUntilLoaded() const;
    // Asks everything in progress to stop and starts nothing more. The object is of no use afterwards.
    void close();

    const VXBundleRef& bundle() const { return bundle_; }

  private:
    struct State;

    void startLoad();
    void runLoads();
    void loadOnce();

    const VXBundleRef bundle_;
    const std::unique_ptr<State> state_;
};

}  // namespace vexo
