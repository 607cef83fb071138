// The library that draws, VexoDrawing, as the framework's finds and loads it.
#pragma once

#include <string>

#include "platform/Renderer.h"

// What the library exports: the renderer, which is the library's and lives as long as the process; nil where
// the caller is of another version. One may be installed over the other while a program runs.
extern "C" const platform::Renderer* vexoRenderer(const char* version);

namespace platform {

// Of the library at `path`, which stays loaded. Throws a std::runtime_error that says why it can't be had.
const Renderer& rendererOfModule(const std::string& path);

}  // namespace platform
