// Raised inside the property-list readers for bytes that are damaged or beyond a bound. Never leaves the
// platform layer.
#pragma once

#include <stdexcept>

namespace platform {

class PropertyListError : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

}  // namespace platform
