// Where the actors meet: a home with its libraries, and names in it, few enough that they meet often.
#pragma once

#include <string>

#include "tests/pathwatcher/RandomSource.h"
#include "tests/support/TemporaryFolder.h"

namespace soak {

using testing_support::RandomSource;

struct Places {
    explicit Places(const testing_support::TemporaryFolder& folder);

    std::string home;
    std::string events;       // the default library of events
    std::string projects;     // the default library of projects
    std::string outside;      // a folder that belongs to no library
    std::string preferences;  // the suite's preference file
    std::string disk;         // where a disk is mounted
    std::string diskImage;
    std::string coveredEvent;    // an event over which another folder is mounted
    std::string coveredProject;  // a folder of projects over which a new file system is mounted
};

// Whole paths. Most are ordinary, and some are not UTF-8, break a line, or are as long as a name can be.
std::string eventIn(const std::string& library, RandomSource& chance);
std::string clipIn(const std::string& event, RandomSource& chance);
std::string projectIn(const std::string& folder, RandomSource& chance);

// A movie among the samples, sound and broken ones.
std::string sampleMovie(RandomSource& chance);
// An archive among the samples, sound and broken ones.
std::string sampleDocument(RandomSource& chance);

// Replaces the content in place. Answers whether that could be done.
bool overwrite(const std::string& path, const std::string& content);
// Never follows a link to write somewhere else.
bool copyOver(const std::string& source, const std::string& path);

}  // namespace soak
