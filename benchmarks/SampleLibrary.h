// Libraries on disk for benchmarks, of any size.
//
// They imitate those of a person who has filmed for years: events of clips that the camera named by its
// clock, projects in folders of a hundred, each with its document and no rendered movie. Loading a library
// reads no clip, so each is one byte that takes up no room; programs that make nothing of empty files see
// them, too.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace bench {

struct LibrarySize {
    int clips = 0;
    int clipsAnEvent = 100;
    int projects = 0;
};

// The folders of the two libraries in a home.
std::string eventsFolder(const std::string& home);
std::string projectsFolder(const std::string& home);

void makeLibraries(const std::string& home, const LibrarySize& size);

// A project's document: a keyed archive of about `size` bytes, in objects of a hundred bytes.
std::vector<std::byte> sampleDocument(std::size_t size, bool isTrailer);

void writeFile(const std::string& path, const std::vector<std::byte>& content);

}  // namespace bench
