// What a watcher must have reported, found out the simple way: by comparing two pictures of a folder.
#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>

namespace testing_support {

struct PicturedEntry {
    bool operator==(const PicturedEntry&) const = default;

    std::uint64_t identity = 0;
    std::uint64_t version = 0;  // of a file's content
    bool isFolder = false;
};

// Folders by their path below the pictured one, which is ""; each with its entries by name.
using Picture = std::map<std::string, std::map<std::string, PicturedEntry>>;

// The folders, relative to the pictured one, that must have been reported: those with other entries than
// before (or the packages around them), and those that are new and not empty.
std::set<std::string> foldersToReport(const Picture& before, const Picture& after);

// The files whose content alone changed, by path. Each must have been reported itself, or the folder or
// package that it is in.
std::set<std::string> filesToReport(const Picture& before, const Picture& after);

// Whether a report covers a file: its own, or that of the folder or package around it.
bool coversFile(const std::set<std::string>& reports, const std::string& file);

}  // namespace testing_support
