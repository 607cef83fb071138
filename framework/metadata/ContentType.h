// What a file is, told by how its content begins: for files whose names do not say it. The desktop's MIME
// database knows the beginnings, file-types.ini says which of our types a MIME type means. Callable from any
// thread.
//
// A beginning can be faked and says nothing of the rest, so a movie by its content may still be unreadable.
#pragma once

#include <string>
#include <string_view>

#include "framework/metadata/FileTypes.h"

namespace vexo {

// nil for what the database cannot tell or we have no type for.
const FileType* typeOfContent(std::string_view beginning);

// The same for the first few KiB of the plain file at a real path; nil also for one that cannot be read and
// for all that is no plain file. Links are followed.
const FileType* typeOfContentOfFile(const std::string& path);

}  // namespace vexo
