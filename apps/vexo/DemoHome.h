// Makes a small, complete sample home: a folder with a library of projects and one of events, with real
// movies.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "apps/vexo/DemoMovieMaker.h"

namespace vexo {

struct DemoHome {
    std::string folder;  // absolute, without links
    std::size_t projects = 0;
    std::size_t trailers = 0;  // of the projects
    std::size_t events = 0;
    std::size_t movies = 0;
    std::uintmax_t bytes = 0;     // of all files
    bool keepsAttributes = true;  // otherwise clips that are dated by attribute fall back on other dates
};

// Either a home or an error in one line.
struct DemoHomeResult {
    std::optional<DemoHome> home;
    std::string error;
};

// Fills `folder`, which is made unless it is there and empty. All or nothing: after an error `folder` is as
// before. A signal that asks the program to end is such an error.
DemoHomeResult makeDemoHome(const std::string& folder, const DemoMovieMaker& movies);

}  // namespace vexo
