// The plug-in: makes the libraries of the video editor Reelix browsable without the editor. It scans the
// libraries into a tree of groups and items, keeps the tree current, and answers for the host's user
// interface.
//
// One class with many small operations, declared here by task and defined in the folder of the task. The
// host makes and drops the object; what is scheduled keeps it alive until it has run.
//
// Threads: the monitor (`_monitor`) guards the lists of library folders and the flat lists of groups; it is
// held across a whole load or scan, and is recursive because a load runs the scans. No lock is taken while
// another one is held.
#pragma once

#include <atomic>
#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "host/VXMediaManager.h"
#include "platform/CalendarDate.h"
#include "platform/KeyedUnarchiver.h"
#include "platform/ThreadSafety.h"

namespace reelix {

namespace ReelixSupport {
struct OrderedEvent;
}

class VXReelixPlugin : public vexo::VXMediaManager,
                       public vexo::VXMediaManagerPlugin_MustImplement,
                       public platform::KeyedUnarchiverDelegate {
  public:
    using Group = vexo::VXMediaGroupRef;
    using Object = vexo::VXMediaObjectRef;
    using Groups = std::vector<Group>;
    using Objects = std::vector<Object>;
    using OrderedEvents = std::vector<ReelixSupport::OrderedEvent>;

    // --- Identity (core/Identity.cpp) ----------------------------------------------------------------------

    static bool isManagedMediaSource();
    std::string rootMediaGroupTitle() override;
    unsigned mediaTypesSupported() override;
    std::string uniqueID() override;
    std::string displayName() override;
    platform::ImageRef displayImage() override;

    // --- Life and lists (core/VXReelixPlugin.cpp) ----------------------------------------------------------

    using VXMediaManager::VXMediaManager;
    ~VXReelixPlugin() override;  // dealloc
    VXMediaManager* init() override;

    // The event groups of the last event scan, then the project groups of the last project scan.
    Groups mediaGroups() override VX_EXCLUDES(_monitor);
    Groups ReelixFolders();
    Groups movieGroups();
    std::optional<std::string> ReelixApplicationVersion() const;

    // --- Loading (core/LoadDriver.cpp) ---------------------------------------------------------------------

    void loadData() override;
    Group performLoadData() override VX_EXCLUDES(_monitor);
    // _setMediaObjectsForRootMediaGroup:; one item for each project and the items of every other child, but
    // none of a project library's.
    void _setMediaObjectsForRootMediaGroup(const Group& rootMediaGroup);
    bool canLoadData() override;
    bool appInstalled() override;
    std::optional<std::string> defaultLoadingMessage() override;
    // defaultNoDataMessage:
    std::optional<std::string> defaultNoDataMessage(const Group& group) override;
    std::vector<vexo::VXLibraryLocations> libraryLocations() override VX_EXCLUDES(_monitor);

    // --- Default locations (core/Locations.cpp); nil without a home ----------------------------------------

    std::optional<std::string> _ReelixDefaultPath();
    std::optional<std::string> _ReelixDefaultPath2();
    std::optional<std::string> _oldReelixDefaultPath();
    std::optional<std::string> _ReelixDefaultEventsFolderPath();
    std::optional<std::string> _ReelixDefaultEventsFolderPath2();

    // --- Preferences and icons (core/Preferences.cpp, core/Icons.cpp) --------------------------------------

    // Reads the order of events; a change leads to one event reload, five seconds later.
    void _checkReelixPreferences();
    void _grabReelixIcons();
    platform::ImageRef rootMediaGroupIcon() override;

    // --- Project library (projects/ProjectReload.cpp) ------------------------------------------------------

    void _prepareReelixProjectsSearchPaths() VX_REQUIRES(_monitor);
    vexo::VXMediaGroupList _reloadReelixProjects();
    // _reloadReelixProjects:; scans every project library. With `updateRoot` it puts the result into the root
    // group. Answers the children of the libraries; when the root was updated, those of all libraries but the
    // first are in the answer twice, because the first library has taken them in by then.
    vexo::VXMediaGroupList _reloadReelixProjects(bool updateRoot);
    // finishReloadReelixProjects:
    void finishReloadReelixProjects(const Group& mergedLibrary);

    // --- Project folders and documents (projects/ProjectScan.cpp, projects/ProjectDocument.cpp) ------------

    // _createReelixProjectsFolderForPath:; the folder group of one folder with everything below it; nil for a
    // nil path. The caller holds the monitor, which guards the flat list that this fills.
    Group _createReelixProjectsFolderForPath(const std::optional<std::string>& path) VX_REQUIRES(_monitor);
    // _isTrailer:; raises platform::ArchiveError for a document that is no keyed archive.
    bool _isTrailer(const std::string& projectPath);
    // unarchiver:cannotDecodeObjectOfClassName:originalClasses:
    platform::ArchivedClass cannotDecodeObjectOfClassName(
        platform::KeyedUnarchiver& unarchiver, std::string_view className,
        const std::vector<std::string>& originalClasses) override;

    // --- Movies of projects (projects/ProjectMovies.cpp, projects/Representative.cpp) ----------------------

    // _renderedMoviesPathsForProjectPath:
    std::vector<std::string> _renderedMoviesPathsForProjectPath(const std::string& projectPath);
    // _previewFileForProjectPath:
    std::optional<std::string> _previewFileForProjectPath(const std::string& projectPath);
    // _durationOfReelixProjectAtPath:; takes an item, despite its name, and sets the item's duration.
    void _durationOfReelixProjectAtPath(const Object& mediaObject);
    // _highestQualityClipByFileSize:, _highestQualityClipByDimensions:, _highestQualityClip:
    Object _highestQualityClipByFileSize(const vexo::VXMediaObjectList& mediaObjects);
    Object _highestQualityClipByDimensions(const vexo::VXMediaObjectList& mediaObjects);
    Object _highestQualityClip(const vexo::VXMediaObjectList& mediaObjects);
    // _representingMediaObjectForProject:; nil when the project has no usable movie.
    Object _representingMediaObjectForProject(const Group& projectGroup);
    // _createReelixProjectsFolderMediaObjects:
    void _createReelixProjectsFolderMediaObjects(const Group& folderGroup);

    // --- Event library (events/EventReload.cpp) ------------------------------------------------------------

    void _prepareReelixEventsSearchPaths() VX_REQUIRES(_monitor);
    Group _reloadReelixEvents();
    // _reloadReelixEvents:updateRootMediaGroup:; the new event library, or nil when it has no year or the
    // load was cancelled.
    Group _reloadReelixEvents(const std::optional<std::string>& parentID, bool updateRootMediaGroup);
    // finishReloadReelixEvents:
    void finishReloadReelixEvents(const Group& eventLibrary);

    // --- Event folders and clips (events/EventScan.cpp, events/ClipDates.cpp) ------------------------------

    // _createReelixEventsFolderForPath:; the library group with its events, nil for a nil path or a folder
    // without entries. Its events are added to `events` as well. The caller holds the monitor, which guards
    // the flat list that this fills.
    Group _createReelixEventsFolderForPath(const std::optional<std::string>& path, OrderedEvents& events)
        VX_REQUIRES(_monitor);
    // _dateFromExtendedFileAttributeAtPath:
    platform::CalendarDateRef _dateFromExtendedFileAttributeAtPath(const std::string& path);
    // _nonCalendarDateFromDate:; a calendar date as a plain one, any other date or nil as it is.
    static platform::DateRef _nonCalendarDateFromDate(const platform::DateRef& date);

    // --- Watching (watching/ChangeWatching.cpp, watching/VolumeMounts.cpp) ---------------------------------

    void watchedPathChanged(const std::string& path, std::uint64_t fileChangedEventFlags) override;
    void watchedQueryChanged(const platform::Notification& notification,
                             const vexo::VXPathListRef& queryScope) override;
    // _watchPath:; watches a path that is not watched yet.
    void _watchPath(const std::string& path);
    // _fileSystemMounted:
    void _fileSystemMounted(const platform::Notification& notification);
    // _fileSystemMountedThreaded:
    void _fileSystemMountedThreaded(const platform::Notification& notification) VX_EXCLUDES(_monitor);
    // validDiskFormat:
    static bool validDiskFormat(const std::string& path);

    // --- Context menus (browser/ContextMenus.cpp) ----------------------------------------------------------

    std::shared_ptr<platform::Menu> contextMenuForMediaObject(const Object& mediaObject,
                                                              const Group& inMediaGroup) override;
    std::shared_ptr<platform::Menu> contextMenuForMediaGroup(const Group& mediaGroup) override;
    // contextMenuOpen: and contextMenuReveal:
    void contextMenuOpen(const platform::MenuItem& sender);
    void contextMenuReveal(const platform::MenuItem& sender);

    // --- Pasteboard (browser/ProjectPasteboard.cpp) --------------------------------------------------------

    // A list that holds one list of one type. Receivers rely on the nesting.
    static platform::Array supportedPasteboardTypes();
    bool writeMediaGroups(const Groups& mediaGroups, platform::Pasteboard& toPasteboard) override;
    bool writeMediaObjects(const Objects& mediaObjects, platform::Pasteboard& toPasteboard) override;
    // dictionaryWithProjects:
    platform::Dictionary dictionaryWithProjects(const Groups& projects);
    // projectGroupsForPaths:; in tree order, each as often as its path is among the paths.
    Groups projectGroupsForPaths(const std::vector<std::string>& paths);
    // projectGroupsForPaths:currentGroup:resultsArray:
    void projectGroupsForPaths(const std::vector<std::string>& paths, const Group& currentGroup,
                               Groups& resultsArray);

    // --- Thumbnail overlays (browser/ThumbnailOverlay.cpp) -------------------------------------------------

    platform::ImageRef thumbnailOverlayForMediaObject(const Object& mediaObject, const Groups& inMediaGroups,
                                                      platform::Size atSize) override;

  protected:
    static constexpr std::chrono::seconds reloadDelay{5};

    std::shared_ptr<VXReelixPlugin> self();

    // The fields of the plug-in object. Pointers are nil until something is said to set them.

    platform::RecursiveMutex _monitor;

    // Held while a reload puts its branch among the root's children and gathers the root's items anew: two
    // reloads that end together would else undo one another.
    platform::Mutex _rootUpdateLock;

    std::unique_ptr<platform::RecursiveMutex> _appIconLock;
    platform::ImageRef _appIcon VX_GUARDED_BY(*_appIconLock);

    // Folders of project libraries and of event libraries, each built by the first load. The event list is
    // shared with the event query and grows as volumes are mounted.
    std::unique_ptr<std::vector<std::string>> _ReelixSearchPaths VX_GUARDED_BY(_monitor);
    vexo::VXPathListRef _ReelixEventsSearchPaths VX_GUARDED_BY(_monitor);

    // Nothing ever sets the version.
    std::optional<std::string> _ReelixAppVersionString;

    // Flags that tolerate a lost race, at the cost of one reload more.
    std::atomic<bool> _missingReelixDefaultPath = false;  // the default project folder was missing last time
    std::atomic<bool> _mostRecentEventFirst = false;      // the order of events; init sets YES

    // Absent during the first check of the preferences, when no other thread can know the object.
    std::unique_ptr<platform::Mutex> _updatePreferencesLock;

    // Every group of the last scans, flat; replaced by a new list when a scan begins.
    std::unique_ptr<Groups> _flatEventGroupsList VX_GUARDED_BY(_monitor);
    std::unique_ptr<Groups> _flatProjectGroupsList VX_GUARDED_BY(_monitor);

    std::atomic<bool> _poolingProjectsReload = false;  // a project reload is scheduled and has not begun
    std::atomic<bool> _poolingEventsReload = false;    // an event reload is scheduled and has not begun

    // Declared for an icon cache that nothing uses.
    std::map<std::string, platform::ImageRef> cachedIcons;

  private:
    void writeProjects(const Groups& projects, platform::Pasteboard& toPasteboard);

    struct EventYears;
    class EventLibraryScan;
    class EventScansAhead;
    struct YearGroups;

    void scanProjectLibraries(Groups& libraries) VX_REQUIRES(_monitor);
    Group projectGroupForPackage(const std::string& package, const std::string& folder) VX_REQUIRES(_monitor);
    Group placeholderGroupForFolder(const std::string& folder);
    Object renderedMovieObject(const std::string& movie, const std::string& package);
    Object newRepresentative(const Group& projectGroup, const Object& movie);

    // The events of all libraries, in the order in which they were found.
    OrderedEvents scanEventLibraries() VX_REQUIRES(_monitor);
    void watchEventLibrary(const std::string& folder);
    Group newEventLibraryGroup(const std::optional<std::string>& parentID);
    void fileEventUnderItsYear(ReelixSupport::OrderedEvent event, const Group& eventLibrary,
                               YearGroups& years);
    Group newYearGroup(const std::optional<platform::Value>& year);

    // The one that was begun ahead, or a new one.
    std::shared_ptr<EventLibraryScan> scanOfEventLibrary(const std::string& folder) VX_REQUIRES(_monitor);
    Group eventGroupForFolder(const std::string& folder, const std::string& libraryFolder,
                              platform::DateRef modificationDate);
    void writeEventAttributes(const Group& event, const EventYears& years);

    void scheduleProjectsReload();
    void scheduleEventsReload();

    struct LoadState {
        unsigned begun;  // loads, ever
        bool isLoading;
    };
    LoadState loadState() const;
    // Has both branches read again when a load went on since `whenScanned`: its tree may have come in the
    // place of the one that a reload has published, or the other way round.
    void reloadAgainAfterLoads(const LoadState& whenScanned);

    std::atomic<unsigned> loadsBegun_ = 0;

    EventScansAhead* eventScansAhead_ VX_GUARDED_BY(_monitor) = nullptr;  // while a load goes on
};

}  // namespace reelix
