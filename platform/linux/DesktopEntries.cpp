#include "platform/linux/DesktopEntries.h"

#include <glib.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <set>
#include <tuple>

#include "platform/Path.h"
#include "platform/linux/PlainFile.h"
#include "platform/linux/UserFolders.h"

namespace platform {

namespace {

constexpr std::size_t largestEntryFile = 1024 * 1024;
constexpr std::size_t mostEntryFiles = 20'000;
constexpr int deepestSubfolder = 8;

constexpr std::string_view entrySuffix = ".desktop";
constexpr const char* creatorCodeKey = "X-Vexo-CreatorCode";

using KeyFile = std::unique_ptr<GKeyFile, decltype(&g_key_file_free)>;

std::string textForKey(GKeyFile* file, const char* key) {
    const std::unique_ptr<char, decltype(&g_free)> text(
        g_key_file_get_string(file, G_KEY_FILE_DESKTOP_GROUP, key, nullptr), &g_free);
    return text ? text.get() : "";
}

bool describesApplication(GKeyFile* file) {
    return textForKey(file, G_KEY_FILE_DESKTOP_KEY_TYPE) == G_KEY_FILE_DESKTOP_TYPE_APPLICATION &&
           !g_key_file_get_boolean(file, G_KEY_FILE_DESKTOP_GROUP, G_KEY_FILE_DESKTOP_KEY_HIDDEN, nullptr);
}

std::string firstWord(const std::string& commandLine) {
    char** words = nullptr;
    if (!g_shell_parse_argv(commandLine.c_str(), nullptr, &words, nullptr))
        return {};
    std::string word = words[0];
    g_strfreev(words);
    return word;
}

std::optional<std::string> programInPath(const std::string& name) {
    if (name.empty() || name.find('/') != std::string::npos)
        return std::nullopt;
    const std::unique_ptr<char, decltype(&g_free)> path(g_find_program_in_path(name.c_str()), &g_free);
    return path && path.get()[0] == '/' ? std::optional<std::string>(path.get()) : std::nullopt;
}

// "kde/editor.desktop" in a folder of entries is the entry "kde-editor".
std::string identifierOfFile(std::string relativePath) {
    relativePath.resize(relativePath.size() - entrySuffix.size());
    std::replace(relativePath.begin(), relativePath.end(), '/', '-');
    return relativePath;
}

// The paths of the entry files below `folder`, relative to it, sorted.
std::vector<std::string> entryFilesBelow(const std::string& folder) {
    namespace fs = std::filesystem;
    std::vector<std::string> paths;
    std::error_code ignored;
    fs::recursive_directory_iterator items(folder, fs::directory_options::skip_permission_denied, ignored),
        end;
    for (; items != end && paths.size() < mostEntryFiles; items.increment(ignored)) {
        if (items.depth() >= deepestSubfolder)
            items.disable_recursion_pending();
        const std::string path = items->path().string();
        if (path.ends_with(entrySuffix))
            paths.push_back(path.substr(folder.size() + 1));
    }
    std::sort(paths.begin(), paths.end());
    return paths;
}

std::optional<DesktopEntry> entryInFile(const std::string& identifier, const std::string& path) {
    const auto content = contentsOfPlainFile(path, largestEntryFile);
    auto entry = content ? desktopEntryWithData(*content) : std::nullopt;
    if (entry)
        std::tie(entry->identifier, entry->path) = std::tie(identifier, path);
    return entry;
}

std::string textOfVariable(const char* name) {
    const char* const value = std::getenv(name);
    return value ? value : "";
}

std::vector<std::string> absolutePathsIn(std::string_view list) {
    std::vector<std::string> paths;
    while (!list.empty()) {
        const auto path = list.substr(0, list.find(':'));
        if (path.starts_with("/"))
            paths.emplace_back(path);
        list.remove_prefix(std::min(path.size() + 1, list.size()));
    }
    return paths;
}

}  // namespace

std::optional<std::string> DesktopEntry::programPath() const {
    const std::string program = tryExec.empty() ? firstWord(exec) : tryExec;
    return program.starts_with("/") ? program : programInPath(program);
}

std::optional<DesktopEntry> desktopEntryWithData(std::string_view data) {
    const KeyFile file(g_key_file_new(), &g_key_file_free);
    if (!g_key_file_load_from_data(file.get(), data.data(), data.size(), G_KEY_FILE_NONE, nullptr) ||
        !describesApplication(file.get()))
        return std::nullopt;
    DesktopEntry entry;
    entry.exec = textForKey(file.get(), G_KEY_FILE_DESKTOP_KEY_EXEC);
    entry.tryExec = textForKey(file.get(), G_KEY_FILE_DESKTOP_KEY_TRY_EXEC);
    entry.icon = textForKey(file.get(), G_KEY_FILE_DESKTOP_KEY_ICON);
    entry.creatorCode = textForKey(file.get(), creatorCodeKey);
    entry.isActivatedByBus = g_key_file_get_boolean(file.get(), G_KEY_FILE_DESKTOP_GROUP,
                                                    G_KEY_FILE_DESKTOP_KEY_DBUS_ACTIVATABLE, nullptr);
    return entry;
}

DesktopEntries::DesktopEntries(std::vector<std::string> dataFolders) : dataFolders_(std::move(dataFolders)) {}

std::optional<DesktopEntry> DesktopEntries::entryWithIdentifier(std::string_view identifier) const {
    for (const auto& [fileIdentifier, path] : entryFiles())
        if (fileIdentifier == identifier)
            return entryInFile(fileIdentifier, path);
    return std::nullopt;
}

std::optional<DesktopEntry> DesktopEntries::entryWithCreatorCode(std::string_view creatorCode) const {
    if (creatorCode.empty())
        return std::nullopt;
    for (const auto& [identifier, path] : entryFiles())
        if (auto entry = entryInFile(identifier, path); entry && entry->creatorCode == creatorCode)
            return entry;
    return std::nullopt;
}

// The first file with an identifier is the entry, also where it only says that the entry is removed.
std::vector<DesktopEntries::EntryFile> DesktopEntries::entryFiles() const {
    std::vector<EntryFile> files;
    std::set<std::string> identifiers;
    for (const auto& dataFolder : dataFolders_) {
        const std::string folder = path::appending(dataFolder, "applications");
        for (const auto& relativePath : entryFilesBelow(folder)) {
            auto identifier = identifierOfFile(relativePath);
            if (identifiers.insert(identifier).second)
                files.push_back({std::move(identifier), path::appending(folder, relativePath)});
        }
    }
    return files;
}

std::vector<std::string> desktopDataFolders() {
    auto folders = absolutePathsIn(textOfVariable("XDG_DATA_DIRS"));
    if (folders.empty())
        folders = {"/usr/local/share", "/usr/share"};
    if (auto own = userDataFolder())
        folders.insert(folders.begin(), *std::move(own));
    return folders;
}

}  // namespace platform
