#include "benchmarks/SampleLibrary.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <filesystem>
#include <stdexcept>

#include "platform/PropertyListWriters.h"
#include "platform/Value.h"
#include "platform/linux/FileDescriptor.h"

namespace bench {

namespace fs = std::filesystem;

namespace {

using platform::Array;
using platform::Dictionary;
using platform::Value;

constexpr int projectsAFolder = 100;
constexpr std::size_t documentSize = 3000;

Value uid(std::int64_t number) {
    return Dictionary{{"CF$UID", number}};
}

// Keys and values are numbers of objects.
Value archivedDictionary(const Array& keys, const Array& values) {
    return Dictionary{{"$class", uid(1)}, {"NS.keys", keys}, {"NS.objects", values}};
}

// Names differ by their time, minute by minute.
std::string clipName(int number) {
    return fmt::format("clip-{}-{:02}-{:02} {:02};{:02};{:02}.mov", 2000 + number / 525'600 % 25,
                       number / 43'800 % 12 + 1, number / 1440 % 28 + 1, number / 60 % 24, number % 60,
                       number % 59);
}

}  // namespace

std::string eventsFolder(const std::string& home) {
    return home + "/Movies/Reelix Events";
}

std::string projectsFolder(const std::string& home) {
    return home + "/Movies/Reelix Projects";
}

void writeFile(const std::string& path, const std::vector<std::byte>& content) {
    const platform::FileDescriptor file(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600));
    if (!file || write(file.number(), content.data(), content.size()) != static_cast<ssize_t>(content.size()))
        throw std::runtime_error("cannot write " + path);
}

void makeLibraries(const std::string& home, const LibrarySize& size) {
    for (int i = 0; i < size.clips; ++i) {
        const std::string event = fmt::format("{}/Event {:05}", eventsFolder(home), i / size.clipsAnEvent);
        if (i % size.clipsAnEvent == 0)
            fs::create_directories(event);
        const std::string clip = event + "/" + clipName(i);
        writeFile(clip, {});
        fs::resize_file(clip, 1);
    }
    const auto document = sampleDocument(documentSize, /*isTrailer=*/false);
    for (int i = 0; i < size.projects; ++i) {
        const std::string project = fmt::format("{}/Folder {:03}/Project {:05}.qnproject",
                                                projectsFolder(home), i / projectsAFolder, i);
        fs::create_directories(project);
        writeFile(project + "/Project", document);
    }
}

// The objects that an answer needs come first, as an archiver writes the root and what hangs on it.
std::vector<std::byte> sampleDocument(std::size_t size, bool isTrailer) {
    constexpr int firstFiller = 9;
    Array objects{"$null",
                  Dictionary{{"$classname", "NSDictionary"}, {"$classes", Array{"NSDictionary"}}},
                  archivedDictionary({uid(3), uid(4)}, {uid(8), uid(5)}),
                  "timeline",
                  "editInfo",
                  archivedDictionary({uid(6)}, {uid(7)}),
                  isTrailer ? "trailer" : "title",
                  "Adventure"};
    Array timeline;
    for (std::size_t bytes = 0; bytes < size; bytes += 108)
        timeline.push_back(uid(static_cast<std::int64_t>(firstFiller + timeline.size())));
    objects.push_back(Dictionary{{"$class", uid(1)}, {"NS.objects", timeline}});
    for (std::size_t i = 0; i < timeline.size(); ++i)
        objects.push_back(fmt::format("{:-<99}", i));
    return platform::binaryPropertyList(Dictionary{{"$archiver", "NSKeyedArchiver"},
                                                   {"$version", 100000},
                                                   {"$objects", std::move(objects)},
                                                   {"$top", Dictionary{{"root", uid(2)}}}});
}

}  // namespace bench
