// The trailer test by libplist, the packaged library for property lists, which reads a document whole.
#pragma once

#include <string>

namespace bench {

bool isTrailerByLibplist(const std::string& document);

}  // namespace bench
