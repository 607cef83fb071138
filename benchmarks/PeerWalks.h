// What others offer for going through libraries. All but Grilo do the work of the bare walk: they look at
// every entry's status and every clip's attribute, answer the trailer test of every document with libplist,
// and keep nothing.
//
// Grilo, the media framework, makes items of what it finds, as a load does; it knows neither the attribute
// nor the documents.
#pragma once

#include <array>
#include <string>

namespace bench {

// What a walk came by.
struct PeerFindings {
    long clips = 0;
    long projects = 0;  // whose documents are no trailers'
};

struct PeerWalk {
    const char* name;
    PeerFindings (*walk)(const std::string& folder);
    bool knowsProjects = true;
};

PeerFindings walkWithStandardLibrary(const std::string& folder);
PeerFindings walkWithGLib(const std::string& folder);
PeerFindings walkWithFTS(const std::string& folder);
PeerFindings walkWithFind(const std::string& folder);
PeerFindings walkWithGrilo(const std::string& folder);

inline constexpr std::array<PeerWalk, 5> peerWalks{{{"std_filesystem", walkWithStandardLibrary},
                                                    {"glib", walkWithGLib},
                                                    {"fts", walkWithFTS},
                                                    {"find", walkWithFind},
                                                    {"grilo", walkWithGrilo, /*knowsProjects=*/false}}};

}  // namespace bench
