// Goes through the event folders of one library, a few clips at a time, on any number of threads. The events
// are those in listing order, and so are their clips.
#pragma once

#include <cstddef>
#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "core/VXReelixPlugin.h"
#include "events/ClipDates.h"
#include "events/SharedWork.h"
#include "platform/FileManager.h"
#include "platform/ThreadSafety.h"
#include "platform/Value.h"

namespace reelix {

// A clip's item, with what its event needs to know of it.
struct VXReelixPlugin::ScannedClip {
    Object mediaObject;
    int year;
    platform::DateRef date;  // may be nil
};

// An event folder and what was found in it.
struct VXReelixPlugin::ScannedEvent {
    platform::Value folder;  // its path, one text for all its clips
    Group event;
    std::vector<std::optional<ScannedClip>>
        clips;  // one for each item of the folder, nil for what is no clip
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
    const std::deque<ScannedEvent>& events() const VX_EXCLUDES(mutex_);

  private:
    static constexpr std::size_t clipsAPiece = 64;

    // Items of one event folder, which stays open as long as some of them are being looked at.
    struct Piece {
        std::shared_ptr<const platform::Folder> folder;
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
    void openNextFolder() VX_REQUIRES(mutex_);
    std::optional<ScannedClip> clipForFile(const platform::Folder& folder, const platform::Value& eventFolder,
                                           const platform::FolderItem& item) const;
    // nil for a file that is not there.
    std::optional<ClipDates> datesOfClip(const platform::Folder& folder,
                                         const platform::FolderItem& item) const;
    Object newClip(const std::string& name, const std::string& clip) const;
    std::string clipName(const platform::CalendarDateRef& date, const std::string& fileName) const;

    VXReelixPlugin& plugin_;
    const ClipNameTexts texts_;
    const platform::Locale locale_;
    const std::string libraryFolder_;

    mutable platform::Mutex mutex_;
    bool isOpened_ VX_GUARDED_BY(mutex_) = false;
    bool hasEntries_ VX_GUARDED_BY(mutex_) = false;
    std::vector<std::string> folders_ VX_GUARDED_BY(mutex_);  // the paths of those that may be events
    std::size_t nextFolder_ VX_GUARDED_BY(mutex_) = 0;
    std::shared_ptr<const platform::Folder> folder_ VX_GUARDED_BY(mutex_);  // the last of the events is its
    std::size_t nextItem_ VX_GUARDED_BY(mutex_) = 0;
    std::deque<ScannedEvent> events_ VX_GUARDED_BY(mutex_);  // an event stays where it is

    SharedWork work_;
};

}  // namespace reelix
