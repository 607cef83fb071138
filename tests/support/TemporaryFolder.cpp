#include "tests/support/TemporaryFolder.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/xattr.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <stdexcept>

namespace fs = std::filesystem;

namespace testing_support {

TemporaryFolder::TemporaryFolder() {
    std::string pattern = fs::temp_directory_path() / "vexo-test-XXXXXX";
    if (!mkdtemp(pattern.data()))
        throw std::runtime_error("cannot make a temporary folder");
    path_ = fs::canonical(pattern);
}

TemporaryFolder::~TemporaryFolder() {
    std::error_code ignored;
    fs::remove_all(path_, ignored);
}

std::string TemporaryFolder::makeFolder(std::string_view relative) const {
    fs::create_directories(path(relative));
    return path(relative);
}

std::string TemporaryFolder::writeFile(std::string_view relative, std::string_view content) const {
    fs::create_directories(fs::path(path(relative)).parent_path());
    std::ofstream file(path(relative), std::ios::binary);
    file << content;
    if (!file.flush())
        throw std::runtime_error("cannot write " + path(relative));
    return path(relative);
}

std::string TemporaryFolder::makeLink(std::string_view relative, const std::string& target) const {
    fs::create_directories(fs::path(path(relative)).parent_path());
    fs::create_symlink(target, path(relative));
    return path(relative);
}

std::string TemporaryFolder::makeFifo(std::string_view relative) const {
    fs::create_directories(fs::path(path(relative)).parent_path());
    if (mkfifo(path(relative).c_str(), 0600) != 0)
        throw std::runtime_error("cannot make the FIFO " + path(relative));
    return path(relative);
}

void TemporaryFolder::remove(std::string_view relative) const {
    fs::remove_all(path(relative));
}

void setExtendedAttribute(const std::string& path, const std::string& name, std::string_view value) {
    ASSERT_EQ(setxattr(path.c_str(), name.c_str(), value.data(), value.size(), 0), 0)
        << "the temporary folder's file system keeps no extended attributes";
}

void setModificationTime(const std::string& path, double secondsSince1970) {
    const double whole = std::floor(secondsSince1970);
    timespec time{static_cast<time_t>(whole), static_cast<long>((secondsSince1970 - whole) * 1e9)};
    const timespec times[2] = {time, time};
    ASSERT_EQ(utimensat(AT_FDCWD, path.c_str(), times, 0), 0);
}

ScopedEnvironment::ScopedEnvironment(std::string name, const char* value) : name_(std::move(name)) {
    const char* previous = std::getenv(name_.c_str());
    wasSet_ = previous != nullptr;
    if (wasSet_)
        previous_ = previous;
    if (value)
        setenv(name_.c_str(), value, 1);
    else
        unsetenv(name_.c_str());
}

ScopedEnvironment::~ScopedEnvironment() {
    if (wasSet_)
        setenv(name_.c_str(), previous_.c_str(), 1);
    else
        unsetenv(name_.c_str());
}

}  // namespace testing_support
