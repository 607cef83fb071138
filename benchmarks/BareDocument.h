// The floor of the trailer test: a reader of well-formed documents that checks nothing.
#pragma once

namespace bench {

// Whether the document that `name` names in the folder `folder` is a trailer's. Maps the file and looks at
// the objects on the way to the answer.
bool isTrailerBarely(int folder, const char* name);

}  // namespace bench
