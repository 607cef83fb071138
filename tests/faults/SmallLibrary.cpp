#include "tests/faults/SmallLibrary.h"

#include "tests/projects/ProjectsTest.h"

namespace testing_support {
namespace {

constexpr const char* projects = "Movies/Reelix Projects/";
constexpr const char* events = "Movies/Reelix Events/";

void addProject(const HostEnvironment& environment, const std::string& package, const std::string& document,
                std::initializer_list<std::string> movies) {
    environment.home.writeFile(projects + package + "/Project", document);
    for (const std::string& movie : movies)
        environment.home.writeFile(projects + package + "/Movies/" + movie, movie);
}

void addEntries(const vexo::VXMediaGroupRef& group, TreeEntries& entries) {
    const std::string ID = group->ID().value_or("");
    if (ID.starts_with('/'))
        entries.insert({ID, ""});
    for (const vexo::VXMediaObjectRef& item : group->ownMediaObjects().value_or(vexo::VXMediaObjectList()))
        entries.insert({ID, item->ID()});
    for (const vexo::VXMediaGroupRef& child : group->childGroups())
        addEntries(child, entries);
}

// Whether the item may stand for a project no longer because another movie of it, the one at the path, does.
bool gaveWay(const TreeEntry& entry, const std::string& path) {
    const std::string folder = platform::path::withoutLastComponent(entry.item);
    return folder == platform::path::withoutLastComponent(path) &&
           platform::path::withoutLastComponent(folder) != entry.group;
}

}  // namespace

void makeSmallLibrary(HostEnvironment& environment, Documents documents) {
    const TemporaryFolder& home = environment.home;
    addProject(environment, "Summer.qnproject", plainDocument(), {"first.mov", "second.m4v"});
    addProject(environment, "Teaser.qnproject", trailerDocument(), {"teaser.mov"});
    if (documents == Documents::oneIsBroken)
        addProject(environment, "Broken.qnproject", "bplist00 and no more", {"broken.mov"});
    addProject(environment, "Folder/Inner.qnproject", plainDocument(), {"inner.mov", "another.mov"});
    addProject(environment, "Secret/Hidden.qnproject", plainDocument(), {"hidden.mov"});
    home.writeFile(std::string(projects) + ".hidden", "Secret\n");
    home.makeFolder(std::string(projects) + "Empty");
    environment.metadata.setMovie(home.path(std::string(projects) + "Teaser.qnproject/Movies/teaser.mov"),
                                  {1280, 720});

    setExtendedAttribute(home.writeFile(std::string(events) + "Beach/dated.mov"), "user.date",
                         "2008-12-31 23;59;59");
    home.writeFile(std::string(events) + "Beach/plain.mov");
    home.writeFile(std::string(events) + "Beach/notes.txt", "no movie");
    home.writeFile(std::string(events) + "Ski/clip-2009-02-03 10;20;30.mov");
    home.makeLink(std::string(events) + "Ski/link.mov", home.writeFile("elsewhere.mov"));
    home.makeFifo(std::string(events) + "Ski/pipe.txt");
    home.writeFile(std::string(events) + "Walk/clip-2009-05-06 11;00;00.mov");
    home.writeFile(std::string(events) + "Walk/undated.mov");
}

std::ostream& operator<<(std::ostream& stream, const TreeEntry& entry) {
    return stream << entry.group << (entry.item.empty() ? "" : " holds " + entry.item);
}

TreeEntries entriesOf(const vexo::VXMediaGroupRef& root) {
    TreeEntries entries;
    if (root)
        addEntries(root, entries);
    return entries;
}

bool isAtOrBelow(const std::string& path, const std::string& folder) {
    return path == folder || path.starts_with(folder + "/");
}

bool isAbout(const TreeEntry& entry, const std::string& path) {
    return isAtOrBelow(entry.group, path) || isAtOrBelow(entry.item, path) || gaveWay(entry, path);
}

}  // namespace testing_support
