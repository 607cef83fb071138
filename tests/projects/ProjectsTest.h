// What the tests of the project library share: libraries on disk, documents, and a file system whose listing
// order does not depend on luck.
#pragma once

#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/PropertyList.h"
#include "tests/support/PathFolder.h"
#include "tests/support/PluginTest.h"

namespace testing_support {

// The environment's file system; folders are listed in byte order unless a test says otherwise. Remembers
// what was listed and opened.
class ScriptedFiles final : public platform::FileManager {
  public:
    explicit ScriptedFiles(HostEnvironment& environment) : environment_(environment) {}

    std::map<std::string, std::vector<std::string>> listings;  // what a folder is said to hold, in order
    std::map<std::string, std::uint32_t> flags;
    std::map<std::string, std::string> displayNames;
    std::function<void(const std::string& folder)> beforeListing;
    std::function<void(const std::string& file)> afterOpening;

    mutable std::vector<std::string> listed;
    mutable std::vector<std::string> opened;
    void forget() {
        listed.clear();
        opened.clear();
    }

    std::optional<std::string> homeDirectory() const override { return real().homeDirectory(); }
    std::optional<platform::FileKind> kindOfItemAtPath(const std::string& path) const override {
        return real().kindOfItemAtPath(path);
    }
    std::optional<std::vector<std::string>> contentsOfDirectoryAtPath(
        const std::string& path) const override {
        listed.push_back(path);
        if (beforeListing)
            beforeListing(path);
        if (const auto scripted = listings.find(path); scripted != listings.end())
            return scripted->second;
        auto names = real().contentsOfDirectoryAtPath(path);
        if (names)
            std::sort(names->begin(), names->end());
        return names;
    }
    std::unique_ptr<platform::Folder> openFolderAtPath(const std::string& path) const override {
        return PathFolder::open(*this, path);
    }
    std::optional<platform::FileAttributes> attributesOfItemAtPath(const std::string& path) const override {
        return real().attributesOfItemAtPath(path);
    }
    std::optional<std::uint32_t> itemFlagsAtPath(const std::string& path) const override {
        const auto scripted = flags.find(path);
        return scripted != flags.end() ? scripted->second : real().itemFlagsAtPath(path);
    }
    std::optional<std::string> displayNameAtPath(const std::string& path) const override {
        const auto scripted = displayNames.find(path);
        return scripted != displayNames.end() ? scripted->second : real().displayNameAtPath(path);
    }
    std::ptrdiff_t extendedAttribute(const std::string& path, std::string_view name,
                                     std::span<char> buffer) const override {
        return real().extendedAttribute(path, name, buffer);
    }
    std::optional<std::string> fileSystemTypeNameAtPath(const std::string& path) const override {
        return real().fileSystemTypeNameAtPath(path);
    }
    std::unique_ptr<platform::ByteSource> openFileAtPath(const std::string& path) const override {
        opened.push_back(path);
        auto file = real().openFileAtPath(path);
        if (file && afterOpening)
            afterOpening(path);
        return file;
    }
    std::optional<std::string> resolvedPath(const std::string& path) const override {
        return real().resolvedPath(path);
    }

  private:
    const platform::FileManager& real() const { return environment_.files(); }

    HostEnvironment& environment_;
};

// --- Documents ---------------------------------------------------------------------------------------------

inline platform::Value uid(int number) {
    return platform::Dictionary{{"CF$UID", number}};
}

// The bytes of a keyed archive. Objects 1 and 2 are the classes NSDictionary and RLXProject, a class that
// nobody but the editor has; the objects given follow from 3 on.
inline std::string archiveOf(const platform::Array& objects, const std::string& topKey = "root",
                             int topObject = 3) {
    using platform::Array;
    using platform::Dictionary;
    Array all{"$null", Dictionary{{"$classname", "NSDictionary"}, {"$classes", Array{"NSDictionary"}}},
              Dictionary{{"$classname", "RLXProject"}, {"$classes", Array{"RLXProject", "NSObject"}}}};
    all.insert(all.end(), objects.begin(), objects.end());
    const platform::Data bytes =
        platform::dataWithPropertyList(Dictionary{{"$archiver", "NSKeyedArchiver"},
                                                  {"$version", 100000},
                                                  {"$objects", all},
                                                  {"$top", Dictionary{{topKey, uid(topObject)}}}},
                                       platform::PropertyListFormat::binary);
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

inline platform::Value archivedDictionary(const platform::Array& keys, const platform::Array& values) {
    return platform::Dictionary{{"$class", uid(1)}, {"NS.keys", keys}, {"NS.objects", values}};
}

inline platform::Value archivedUnknown() {
    return platform::Dictionary{{"$class", uid(2)}, {"title", uid(0)}};
}

// Root -> "editInfo" -> "trailer", the last being `trailer`.
inline std::string documentWithTrailer(const platform::Value& trailer) {
    return archiveOf({archivedDictionary({uid(4)}, {uid(5)}), "editInfo",
                      archivedDictionary({uid(6)}, {uid(7)}), "trailer", trailer});
}

inline std::string trailerDocument() {
    return documentWithTrailer("Adventure");
}

inline std::string plainDocument() {
    return archiveOf({archivedDictionary({uid(4)}, {uid(5)}), "editInfo",
                      archivedDictionary({uid(6)}, {uid(7)}), "title", "Summer"});
}

// --- The fixture -------------------------------------------------------------------------------------------

class ProjectsTest : public PluginTest {
  protected:
    using Group = vexo::VXMediaGroupRef;
    using Object = vexo::VXMediaObjectRef;
    using Strings = std::vector<std::string>;

    ProjectsTest() { installFiles(); }

    void setHomeDirectory(std::optional<std::string> homeDirectory) {
        filesScope_.reset();
        environment.setHomeDirectory(std::move(homeDirectory));
        installFiles();
    }

    // A package with the movies named, 1280 x 720 each; paths are relative to the home.
    std::string makeProject(const std::string& package, const Strings& movies = {}) {
        std::string path = home().makeFolder(package);
        for (const std::string& movie : movies)
            environment.metadata.setMovie(home().writeFile(package + "/Movies/" + movie, "movie"),
                                          {1280, 720});
        return path;
    }

    // One scan of a folder, with a new flat list. `files` remembers what this scan did.
    Group scan(const std::optional<std::string>& folder) {
        platform::Locked monitor(plugin()._monitor);
        files.forget();
        plugin()._flatProjectGroupsList = std::make_unique<reelix::VXReelixPlugin::Groups>();
        return plugin()._createReelixProjectsFolderForPath(folder);
    }
    void setSearchPaths(Strings paths) {
        platform::Locked monitor(plugin()._monitor);
        plugin()._ReelixSearchPaths = std::make_unique<Strings>(std::move(paths));
    }
    // Makes an item as a scan does, `size` as the file's metadata have it.
    Object movieObject(const std::string& path, std::optional<platform::Size> size = std::nullopt) {
        Object object = plugin().newMediaObjectWithType(vexo::VXMediaTypeMovie, path, path);
        object->setPath(path);
        if (size)
            object->setAttribute(*size, vexo::VXMediaObjectResolutionKey);
        return object;
    }
    Group newGroup(const vexo::VXGroupTypeIdentifier& type, const std::string& name) {
        Group group = plugin().newMediaGroupWithTypeIdentifier(type, name);
        group->setName(name);
        return group;
    }

    std::string inHome(std::string text) const {
        for (auto at = text.find(home().path()); at != std::string::npos; at = text.find(home().path(), at))
            text.replace(at, home().path().size(), "home");
        return text;
    }
    Strings inHome(Strings texts) const {
        for (std::string& text : texts)
            text = inHome(std::move(text));
        return texts;
    }
    std::string text(const Group& group) const { return treeText(group, home().path()); }
    // The flat list of project groups, one line each.
    std::string flatList() {
        platform::Locked monitor(plugin()._monitor);
        std::string lines;
        for (const Group& group : *plugin()._flatProjectGroupsList) {
            const Group alone = group->copy();
            alone->setChildGroups({});
            alone->setMediaObjects({});
            lines += text(alone);
        }
        return lines;
    }

    ScriptedFiles files{environment};

  private:
    void installFiles() {
        filesScope_.emplace(platform::Services{files, environment.workspace, environment.userDefaults,
                                               environment.dispatcher, environment.notifications,
                                               environment.log});
    }

    std::optional<platform::ServicesScope> filesScope_;
};

inline std::vector<std::string> namesOf(const vexo::VXMediaGroupList& groups) {
    std::vector<std::string> names;
    for (const vexo::VXMediaGroupRef& group : groups)
        names.push_back(group->name().value_or("<none>"));
    return names;
}

inline std::vector<std::string> idsOf(const vexo::VXMediaObjectList& mediaObjects) {
    std::vector<std::string> ids;
    for (const vexo::VXMediaObjectRef& mediaObject : mediaObjects)
        ids.push_back(mediaObject->ID());
    return ids;
}

}  // namespace testing_support
