// Goes through the event folders of one library, some files at a time, on any number of threads. The events
// are those in listing order, and so are their clips.
//
// A thread reads the next files of a folder and makes their clips; meanwhile another may read on in the same
// one.
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
    // Those of its folders that hold anything, be any of it a clip or not.
    Groups events() const VX_EXCLUDES(mutex_);

  private:
    // What was found in files that were read together. Their clips have a text and an icon of their own in
    // common, because threads that count the owners of one object wait for each other at every clip.
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
        std::unique_ptr<platform::Folder> open;  // nil but while it's being gone through
        std::list<ScannedFiles> files;           // in listing order; each stays where it is
        bool isEvent = false;                    // it holds anything, and could be read as far as it was
        std::atomic<int> unfinishedPieces = 1;   // what is being scanned, and what is yet to be read
        Group event;                             // nil until the last piece is finished, and where it's none
    };

    // Files of one folder, for the thread that has read them.
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
    // nil when there is none that could be read now.
    ScannedFolder* takeFolder() VX_REQUIRES(mutex_);
    // The next of a folder that was taken.
    Piece readPiece(const platform::Folder* library, ScannedFolder& folder) VX_EXCLUDES(mutex_);
    // Opens the folder where that is to be done first. nil when its items can't be read.
    static std::optional<std::vector<platform::FolderItem>> nextItems(const platform::Folder* library,
                                                                      ScannedFolder& folder);
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
    std::deque<ScannedFolder> folders_ VX_GUARDED_BY(mutex_);           // each stays where it is
    std::size_t nextFolder_ VX_GUARDED_BY(mutex_) = 0;                  // that nobody has begun to open
    std::deque<ScannedFolder*> foldersToReadOn_ VX_GUARDED_BY(mutex_);  // that are open
    int foldersBeingRead_ VX_GUARDED_BY(mutex_) = 0;
    std::condition_variable_any folderRead_;

    SharedWork work_;
};

}  // namespace reelix
