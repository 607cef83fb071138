#include "tests/pathwatcher/ExpectedReports.h"

#include "framework/pathwatcher/PackageName.h"
#include "platform/Path.h"

namespace testing_support {

namespace path = platform::path;

namespace {

using Entries = std::map<std::string, PicturedEntry>;

const Entries* find(const Picture& picture, const std::string& folder) {
    const auto found = picture.find(folder);
    return found == picture.end() ? nullptr : &found->second;
}

// 0 for the pictured folder itself.
std::uint64_t identityOf(const Picture& picture, const std::string& folder) {
    if (folder.empty())
        return 0;
    return picture.at(path::withoutLastComponent(folder)).at(path::lastComponent(folder)).identity;
}

// Content doesn't count.
bool haveSameEntries(const Entries& one, const Entries& other) {
    if (one.size() != other.size())
        return false;
    for (const auto& [name, entry] : one) {
        const auto counterpart = other.find(name);
        if (counterpart == other.end() || counterpart->second.identity != entry.identity ||
            counterpart->second.isFolder != entry.isFolder)
            return false;
    }
    return true;
}

}  // namespace

std::set<std::string> foldersToReport(const Picture& before, const Picture& after) {
    std::set<std::string> folders;
    for (const auto& [folder, entries] : after) {
        const Entries* const earlier = find(before, folder);
        const bool isSame = earlier && identityOf(before, folder) == identityOf(after, folder);
        if (isSame ? !haveSameEntries(*earlier, entries) : !entries.empty())
            folders.emplace(vexo::outermostPackageOrAll(folder));
    }
    return folders;
}

std::set<std::string> filesToReport(const Picture& before, const Picture& after) {
    std::set<std::string> files;
    for (const auto& [folder, entries] : after) {
        const Entries* const earlier = find(before, folder);
        for (const auto& [name, entry] : entries) {
            if (!earlier || entry.isFolder || !earlier->contains(name))
                continue;
            const PicturedEntry& was = earlier->at(name);
            if (was.identity == entry.identity && was.version != entry.version)
                files.insert(path::appending(folder, name));
        }
    }
    return files;
}

bool coversFile(const std::set<std::string>& reports, const std::string& file) {
    return reports.contains(file) ||
           reports.contains(std::string(vexo::outermostPackageOrAll(path::withoutLastComponent(file))));
}

}  // namespace testing_support
