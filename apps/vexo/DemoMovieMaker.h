// Makes the movies of a sample home. A helper program encodes them, because FFmpeg is linked by helpers
// alone.
#pragma once

#include <optional>
#include <string>

#include "apps/vexo/DemoContents.h"

namespace vexo {

class DemoMovieMaker {
  public:
    // The helper beside the running program, else where it is installed.
    DemoMovieMaker();
    explicit DemoMovieMaker(std::string program) : program_(std::move(program)) {}

    // Writes the movie to `path`, which is absolute, and waits for it. `tint` is a number that chooses its
    // colour.
    std::optional<std::string> make(const std::string& path, const DemoMovie& movie, int tint) const;

  private:
    const std::string program_;
};

}  // namespace vexo
