// Goes through the event folders of one library, some files at a time, on any number of threads. The events
// are those in listing order, and so are their clips.
//
// A folder is read by one thread. The clips of what it has read are made by any.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <list>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "core/VXReelixPlugin.h"
#include "events/ClipDates.h"
#include "events/EventOrder.h"
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
    // In listing order. They can be taken once.
    struct Events {
        Groups all;  // of folders that hold anything, be any of it a clip or not
        OrderedEvents withClips;
    };
    Events takeEvents() VX_EXCLUDES(mutex_);

  private:
    // What was found in one piece of a folder. Its clips have a text and an icon of their own in common,
    // because threads that count the owners of one object wait for each other at every clip.
    struct ScannedFiles {
        platform::Value folder;  // its path
        platform::ImageRef clipIcon;
        Objects clips;
        EventYears years;
    };

    // A folder that may be an event, and what was found in it.
    struct ScannedFolder {
        ScannedFolder(std::string folderPath, const platform::FolderItem& itemOfLibrary)
            : path(std::move(folderPath)), item(itemOfLibrary) {}

        const std::string path;
        const platform::FolderItem item;         // of the library's folder, as long as that is open
        std::unique_ptr<platform::Folder> open;  // until the last piece is finished; nil where it can't be
        std::list<ScannedFiles> files;           // in listing order; each stays where it is
        bool isEvent = false;                    // it holds anything, and could be read as far as it was
        std::atomic<int> unfinishedPieces = 1;   // the last one counts before it's there
        bool hasClips = false;
        // nil until the last piece is finished, and where it's none. What it is ordered by is asked of it
        // here, on any thread, and not of one cold event after another when all are there.
        std::optional<ReelixSupport::OrderedEvent> event;
    };

    // Files of one folder that were read together.
    struct Piece {
        ScannedFolder* folder;
        std::vector<platform::FolderItem> items;
        ScannedFiles* found;
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
    // Answers the last piece of the folder, which may be empty; others are left for whoever comes first.
    Piece readFolder(const platform::Folder& library, ScannedFolder& folder) VX_EXCLUDES(mutex_);
    Piece readPieces(const platform::Folder& library, ScannedFolder& folder) VX_EXCLUDES(mutex_);
    static Piece newPiece(ScannedFolder& folder, std::vector<platform::FolderItem> items);
    void finishPiece(ScannedFolder& folder) const;
    void makeEvent(ScannedFolder& folder) const;
    // nil for what is no clip.
    Object clipForFile(const platform::FolderItem& item, const Piece& piece) const;
    // nil for a file that is not there.
    std::optional<ClipDates> datesOfClip(const platform::Folder& folder,
                                         const platform::FolderItem& item) const;
    Object newClip(std::string name, std::string clip, const ScannedFiles& files) const;
    std::string clipName(const platform::CalendarDateRef& date, std::string_view fileName) const;

    VXReelixPlugin& plugin_;
    const ClipNameTexts texts_;
    const platform::Locale locale_;
    const platform::LocalZone zone_;
    const std::string libraryFolder_;

    mutable platform::Mutex mutex_;
    bool isOpened_ VX_GUARDED_BY(mutex_) = false;
    // nil but as long as there are folders to open.
    std::unique_ptr<platform::Folder> library_ VX_GUARDED_BY(mutex_);
    bool hasEntries_ VX_GUARDED_BY(mutex_) = false;
    std::deque<ScannedFolder> folders_ VX_GUARDED_BY(mutex_);  // each stays where it is
    std::size_t nextFolder_ VX_GUARDED_BY(mutex_) = 0;         // that nobody has begun to open
    int foldersBeingRead_ VX_GUARDED_BY(mutex_) = 0;
    std::deque<Piece> pieces_ VX_GUARDED_BY(mutex_);  // that nobody has taken
    std::condition_variable_any pieceIsReady_;        // or will never be

    SharedWork work_;
};

}  // namespace reelix
