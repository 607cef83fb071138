// A small library of either kind with something broken in it, and what a tree made from it holds.
#pragma once

#include <compare>
#include <ostream>
#include <set>
#include <string>

#include "host/VXMediaGroup.h"
#include "tests/support/HostEnvironment.h"

namespace testing_support {

// A broken document has everything looked at twice: the host begins anew without it.
enum class Documents { oneIsBroken, allWell };

// Lies in "Movies" in the environment's home. Every event has two clips or more, and no project two movies of
// one size, so it is no matter of luck which of them stands for it.
void makeSmallLibrary(HostEnvironment& environment, Documents documents = Documents::oneIsBroken);

// A group that stands for something on disk, or an item of a group; groups and items by their IDs.
struct TreeEntry {
    std::string group;
    std::string item;  // empty for the group itself

    auto operator<=>(const TreeEntry&) const = default;
};
using TreeEntries = std::set<TreeEntry>;

std::ostream& operator<<(std::ostream& stream, const TreeEntry& entry);

TreeEntries entriesOf(const vexo::VXMediaGroupRef& root);

bool isAtOrBelow(const std::string& path, const std::string& folder);
// Whether a tree may lack it when something went wrong at the path: it lies there, or what lies there may now
// stand for a project in its place.
bool isAbout(const TreeEntry& entry, const std::string& path);

}  // namespace testing_support
