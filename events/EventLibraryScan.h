// Goes through the event folders of one library, some clips at a time, on any number of threads. The events
// are those in listing order, and so are their clips.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "core/VXReelixPlugin.h"
#include "events/ClipDates.h"
#include "events/SharedWork.h"
#include "platform/CalendarDate.h"
#include "platform/FileManager.h"
#include "platform/LocalZone.h"
#include "platform/ThreadSafety.h"
#include "platform/Value.h"

namespace reelix {

// The earliest and the latest year among clips, and the dates of the clips that set them, which may be nil.
// Only years are compared: among clips of one year the first in listing order stays.
struct VXReelixPlugin::EventYears {
    static constexpr int noLowest = 9999;

    int lowest = noLowest;
    platform::DateRef lowestDate;
    int highest = 0;
    platform::DateRef highestDate;

    // `following` are those of clips that are listed after these.
    void add(const EventYears& following);
    void add(int year, const platform::DateRef& date);
};

// A folder that may be an event, and what was found in it.
struct VXReelixPlugin::ScannedEvent {
    platform::Value folder;            // its path, one text for all its clips
    const platform::FolderItem* item;  // of the library's folder, as long as that is open
    Group event;                       // nil for a folder that is none
    platform::ImageRef clipIcon;       // asked for once for all its clips
    Objects clips;                     // one for each item of the folder, nil for what is no clip
    std::vector<EventYears> years;     // of each piece of the clips
};

class VXReelixPlugin::EventLibraryScan {
  public:
    // Whoever works on it keeps the plug-in alive.
    EventLibraryScan(VXReelixPlugin& plugin, std::string libraryFolder);

    const std::string& libraryFolder() const { return libraryFolder_; }
    // What scans the library; begins with nothing, so that it may wait for long.
    SharedWork& work() { return work_; }

    // What follows requires that the work is finished.

    // Whether the library's folder can be listed and holds anything.
    bool hasEntries() const VX_EXCLUDES(mutex_);
    // For the caller to keep.
    std::vector<ScannedEvent> takeEvents() VX_EXCLUDES(mutex_);

  private:
    static constexpr std::size_t clipsAPiece = 128;

    using FolderRef = std::shared_ptr<const platform::Folder>;

    struct OpenFolder {
        FolderRef folder;
        ScannedEvent* event;
        std::size_t nextItem = 0;  // that nobody has taken
    };

    // Items of one event folder, which stays open as long as some of them are being looked at.
    struct Piece {
        FolderRef folder;
        ScannedEvent* event;
        std::size_t begin;
        std::size_t end;
    };

    struct ClipDates {
        platform::CalendarDateRef own;  // of the attribute or the name; nil for none
        platform::DateRef creation;     // nil also where it isn't needed
        int year;
    };

    // False when everything has been taken.
    bool scanNextClips() VX_EXCLUDES(mutex_);
    std::optional<Piece> takePiece() VX_EXCLUDES(mutex_);
    void openLibrary() VX_REQUIRES(mutex_);
    void closeLibraryWhenDone() VX_REQUIRES(mutex_);
    // Waits where only what other threads are opening can bring more.
    void waitForWork() VX_REQUIRES(mutex_);
    Piece nextPiece() VX_REQUIRES(mutex_);
    // nil when there is none left.
    ScannedEvent* nextFolderToOpen() VX_REQUIRES(mutex_);
    void openEvent(const platform::Folder& library, ScannedEvent& event) VX_EXCLUDES(mutex_);
    // nil for a folder that is no event.
    FolderRef folderOfEvent(const platform::Folder& library, ScannedEvent& event) const;
    // nil for what is no clip.
    Object clipForFile(const platform::Folder& folder, const ScannedEvent& event,
                       const platform::FolderItem& item, EventYears& years) const;
    // nil for a file that is not there.
    std::optional<ClipDates> datesOfClip(const platform::Folder& folder,
                                         const platform::FolderItem& item) const;
    Object newClip(std::string name, std::string clip, const ScannedEvent& event) const;
    std::string clipName(const platform::CalendarDateRef& date, std::string_view fileName) const;

    VXReelixPlugin& plugin_;
    const ClipNameTexts texts_;
    const platform::Locale locale_;
    const platform::LocalZone zone_;
    const std::string libraryFolder_;

    mutable platform::Mutex mutex_;
    bool isOpened_ VX_GUARDED_BY(mutex_) = false;
    FolderRef library_ VX_GUARDED_BY(mutex_);  // nil but as long as there are events to open
    bool hasEntries_ VX_GUARDED_BY(mutex_) = false;
    std::vector<ScannedEvent> events_ VX_GUARDED_BY(mutex_);  // each stays where it is
    std::size_t nextEvent_ VX_GUARDED_BY(mutex_) = 0;         // whose folder nobody has begun to open
    int foldersBeingOpened_ VX_GUARDED_BY(mutex_) = 0;
    std::deque<OpenFolder> openFolders_ VX_GUARDED_BY(mutex_);  // that have items left
    std::condition_variable_any folderOpened_;

    SharedWork work_;
};

}  // namespace reelix
