#include "tests/hostile/DeepFolder.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <system_error>

#include "tests/support/Program.h"

namespace testing_support {

using platform::FileDescriptor;

namespace {

FileDescriptor openFolder(int around, const std::string& name) {
    FileDescriptor folder(openat(around, name.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder)
        throw std::system_error(errno, std::generic_category(), "cannot open the folder " + name);
    return folder;
}

FileDescriptor newFolder(int around, const std::string& name) {
    if (mkdirat(around, name.c_str(), 0700) != 0)
        throw std::system_error(errno, std::generic_category(), "cannot make the folder " + name);
    return openFolder(around, name);
}

}  // namespace

DeepFolder::DeepFolder(std::string top) : top_(std::move(top)), deepest_(openFolder(AT_FDCWD, top_)) {}

DeepFolder::~DeepFolder() {
    runProgram("rm", {"-rf", top_});
}

void DeepFolder::descend(int levels, const std::string& name) {
    for (int i = 0; i < levels; ++i)
        deepest_ = newFolder(deepest_.number(), name);
}

void DeepFolder::makeProject(const std::string& name) {
    const FileDescriptor movies = newFolder(newFolder(deepest_.number(), name).number(), "Movies");
    FileDescriptor(openat(movies.number(), "movie.mov", O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
}

}  // namespace testing_support
