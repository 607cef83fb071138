// What others offer for going through a folder: each looks at every entry's status and keeps nothing.
//
// They read no extended attribute and no document, so they do less than the floor of a first load does.
#pragma once

#include <array>
#include <string>

namespace bench {

struct PeerWalk {
    const char* name;
    // How many plain files there are in a folder and those in it.
    long (*countFiles)(const std::string& folder);
};

long countWithStandardLibrary(const std::string& folder);
long countWithGLib(const std::string& folder);
long countWithFTS(const std::string& folder);
long countWithFind(const std::string& folder);

inline constexpr std::array<PeerWalk, 4> peerWalks{{{"std_filesystem", countWithStandardLibrary},
                                                    {"glib", countWithGLib},
                                                    {"fts", countWithFTS},
                                                    {"find", countWithFind}}};

}  // namespace bench
