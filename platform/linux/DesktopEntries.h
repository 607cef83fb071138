// The desktop entries of installed applications.
//
// GIO has a list of its own. It leaves out entries whose program is missing, and an application that the
// desktop knows and that was removed is a case of its own here, so the files are read directly.
//
// Every question reads the files: they are small and the questions rare. Callable from any thread.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

// What an entry of type Application says. Texts that it lacks are empty.
struct DesktopEntry {
    std::string identifier;  // "com.norvale.ReelixApp", without ".desktop"
    std::string exec;        // a command line
    std::string tryExec;     // the program that tells whether the application is there
    std::string icon;
    std::string creatorCode;        // key X-Vexo-CreatorCode
    bool isActivatedByBus = false;  // a message to it on the session bus starts the application
    std::string path = {};          // of the file the entry is in

    // The absolute path of the program: as the entry has it, whether it exists or not, or where PATH finds
    // its name; nil when PATH does not find it.
    std::optional<std::string> programPath() const;
};

// Reads the content of an entry file; nil when it describes no application or says it is removed. The
// identifier and the path stay empty.
std::optional<DesktopEntry> desktopEntryWithData(std::string_view data);

class DesktopEntries {
  public:
    // `dataFolders` by falling precedence, each with its entries in "applications".
    explicit DesktopEntries(std::vector<std::string> dataFolders);

    std::optional<DesktopEntry> entryWithIdentifier(std::string_view identifier) const;
    // The first by folder, then by identifier.
    std::optional<DesktopEntry> entryWithCreatorCode(std::string_view creatorCode) const;

  private:
    struct EntryFile {
        std::string identifier;
        std::string path;
    };

    std::vector<EntryFile> entryFiles() const;

    const std::vector<std::string> dataFolders_;
};

// The user's data folder and the system's, by falling precedence: XDG_DATA_HOME, XDG_DATA_DIRS or their
// defaults. Relative ones are ignored.
std::vector<std::string> desktopDataFolders();

}  // namespace platform
