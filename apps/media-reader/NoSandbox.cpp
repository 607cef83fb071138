#include "apps/media-reader/Sandbox.h"

namespace reader {

std::vector<std::string> enterSandbox() {
    return {};
}

}  // namespace reader
