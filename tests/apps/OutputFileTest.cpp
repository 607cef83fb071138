#include "apps/vexo/OutputFile.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <thread>

#include "tests/support/FileContent.h"
#include "tests/support/OrdinaryUser.h"
#include "tests/support/TemporaryFolder.h"

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;
using testing_support::contentOf;

using Problem = std::optional<std::string>;

Problem write(const std::string& path, std::string_view content) {
    return vexo::writeFile(path, std::as_bytes(std::span(content)));
}

mode_t permissionsOf(const std::string& path) {
    struct stat status {};
    EXPECT_EQ(stat(path.c_str(), &status), 0) << path;
    return status.st_mode & 07777;
}

// No file of this process grows beyond the size for the length of a scope, as on a disk that is full.
class FileSizeLimit {
  public:
    explicit FileSizeLimit(rlim_t bytes) {
        getrlimit(RLIMIT_FSIZE, &previous_);
        const rlimit limit{bytes, previous_.rlim_max};
        setrlimit(RLIMIT_FSIZE, &limit);
    }
    ~FileSizeLimit() {
        setrlimit(RLIMIT_FSIZE, &previous_);
        std::signal(SIGXFSZ, previousHandler_);
    }

  private:
    rlimit previous_{};
    const sighandler_t previousHandler_ = std::signal(SIGXFSZ, SIG_IGN);
};

class OutputFileTest : public testing::Test {
  protected:
    std::vector<std::string> names() const {
        std::vector<std::string> found;
        for (const fs::directory_entry& entry : fs::directory_iterator(folder.path()))
            found.push_back(entry.path().filename());
        std::sort(found.begin(), found.end());
        return found;
    }

    testing_support::TemporaryFolder folder;
};

TEST_F(OutputFileTest, ANewFileHoldsTheBytesAndHasTheUsualPermissions) {
    const std::string bytes("a\0b\n\xFF", 5);
    const mode_t previous = umask(027);
    EXPECT_EQ(write(folder.path("new"), bytes), std::nullopt);
    umask(previous);
    EXPECT_EQ(contentOf(folder.path("new")), bytes);
    EXPECT_EQ(permissionsOf(folder.path("new")), 0640u);
    EXPECT_THAT(names(), ElementsAre("new"));
}

TEST_F(OutputFileTest, NoBytesMakeAnEmptyFile) {
    EXPECT_EQ(write(folder.path("new"), ""), std::nullopt);
    EXPECT_EQ(fs::file_size(folder.path("new")), 0u);
}

TEST_F(OutputFileTest, ANameIsRelativeToTheWorkingFolder) {
    const fs::path previous = fs::current_path();
    fs::current_path(folder.path());
    EXPECT_EQ(write("new", "x"), std::nullopt);
    fs::current_path(previous);
    EXPECT_EQ(contentOf(folder.path("new")), "x");
}

TEST_F(OutputFileTest, AFileIsReplacedByAnotherOneAndKeepsItsPermissions) {
    const std::string file = folder.writeFile("file", "a much longer content than before");
    fs::permissions(file, fs::perms(0604));
    fs::create_hard_link(file, folder.path("other name"));
    EXPECT_EQ(write(file, "new"), std::nullopt);
    EXPECT_EQ(contentOf(file), "new");
    EXPECT_EQ(permissionsOf(file), 0604u);
    EXPECT_EQ(contentOf(folder.path("other name")), "a much longer content than before");
}

TEST_F(OutputFileTest, TheOwnerStaysWhereTheWriterMayGiveFilesAway) {
    if (geteuid() != 0)
        GTEST_SKIP() << "only root may";
    const std::string file = folder.writeFile("file", "old");
    ASSERT_EQ(chown(file.c_str(), 65534, 65534), 0);
    EXPECT_EQ(write(file, "new"), std::nullopt);
    struct stat status {};
    ASSERT_EQ(stat(file.c_str(), &status), 0);
    EXPECT_EQ(status.st_uid, 65534u);
    EXPECT_EQ(status.st_gid, 65534u);
}

TEST_F(OutputFileTest, WithoutRoomTheFileStaysAsItWasAndNothingIsLeft) {
    const std::string file = folder.writeFile("file", "old");
    Problem problem;
    {
        const FileSizeLimit limit(4096);
        problem = write(file, std::string(10'000, 'x'));
    }
    EXPECT_THAT(problem, Optional(HasSubstr("cannot write '" + file + "': ")));
    EXPECT_EQ(contentOf(file), "old");
    EXPECT_THAT(names(), ElementsAre("file"));
}

TEST_F(OutputFileTest, WithoutRoomThereIsNoNewFile) {
    Problem problem;
    {
        const FileSizeLimit limit(4096);
        problem = write(folder.path("new"), std::string(10'000, 'x'));
    }
    EXPECT_TRUE(problem);
    EXPECT_THAT(names(), IsEmpty());
}

TEST_F(OutputFileTest, WhereAFolderLiesNothingIsWritten) {
    const std::string inside = folder.makeFolder("inside");
    EXPECT_THAT(write(inside, "x"), Optional(HasSubstr("Is a directory")));
    EXPECT_TRUE(write(inside + "/new/", "x"));
    EXPECT_TRUE(fs::is_empty(inside));
    EXPECT_THAT(names(), ElementsAre("inside"));
}

TEST_F(OutputFileTest, NamesThatCannotBeAreProblems) {
    const std::string file = folder.writeFile("file");
    EXPECT_EQ(write("", "x"), Problem("the file to write has no name"));
    EXPECT_THAT(write(folder.path("no/new"), "x"), Optional(HasSubstr("No such file or directory")));
    EXPECT_THAT(write(file + "/new", "x"), Optional(HasSubstr("Not a directory")));
    EXPECT_THAT(write(folder.path(std::string(300, 'x')), "x"), Optional(HasSubstr("File name too long")));
    EXPECT_THAT(names(), ElementsAre("file"));
}

TEST_F(OutputFileTest, ANameAsLongAsNamesCanBeIsWritten) {
    const std::string name(255, 'x');
    EXPECT_EQ(write(folder.path(name), "x"), std::nullopt);
    EXPECT_EQ(write(folder.path(name), "y"), std::nullopt);
    EXPECT_EQ(contentOf(folder.path(name)), "y");
}

TEST_F(OutputFileTest, AFileThatMayNotBeWrittenIsNotReplaced) {
    const std::string file = folder.writeFile("file", "old");
    fs::permissions(file, fs::perms(0444));
    const testing_support::OrdinaryUser user(folder.path());
    EXPECT_THAT(write(file, "new"), Optional(HasSubstr("Permission denied")));
    EXPECT_EQ(contentOf(file), "old");
}

TEST_F(OutputFileTest, WhereNoFileMayBeMadeNothingChanges) {
    const std::string file = folder.writeFile("closed/file", "old");
    fs::permissions(file, fs::perms(0666));
    const testing_support::OrdinaryUser user(folder.path());
    EXPECT_THAT(write(folder.path("closed/new"), "new"), Optional(HasSubstr("Permission denied")));
    EXPECT_THAT(write(file, "new"), Optional(HasSubstr("Permission denied")));
    EXPECT_EQ(contentOf(file), "old");
}

TEST_F(OutputFileTest, ALinkStaysALinkAndItsTargetIsReplacedWhole) {
    const std::string target = folder.writeFile("other/target", "old");
    const std::string first = folder.makeLink("first", "second");
    folder.makeLink("second", "other/target");
    EXPECT_EQ(write(first, "new"), std::nullopt);
    EXPECT_TRUE(fs::is_symlink(first));
    EXPECT_TRUE(fs::is_symlink(folder.path("second")));
    EXPECT_EQ(contentOf(target), "new");

    const FileSizeLimit limit(4096);
    EXPECT_TRUE(write(first, std::string(10'000, 'x')));
    EXPECT_EQ(contentOf(target), "new");
}

TEST_F(OutputFileTest, ALinkToNothingMakesItsTarget) {
    const std::string link = folder.makeLink("link", folder.path("target"));
    EXPECT_EQ(write(link, "new"), std::nullopt);
    EXPECT_TRUE(fs::is_symlink(link));
    EXPECT_EQ(contentOf(folder.path("target")), "new");
}

TEST_F(OutputFileTest, LinksThatLeadInACircleAreAProblem) {
    folder.makeLink("a", "b");
    folder.makeLink("b", "a");
    EXPECT_THAT(write(folder.path("a"), "x"), Optional(HasSubstr("Too many levels of symbolic links")));
    EXPECT_THAT(names(), ElementsAre("a", "b"));
}

TEST_F(OutputFileTest, APipeIsWrittenToAndStaysAPipe) {
    const std::string pipe = folder.makeFifo("pipe");
    std::string received;
    std::thread reader([&] { received = contentOf(pipe); });
    EXPECT_EQ(write(pipe, "through the pipe"), std::nullopt);
    reader.join();
    EXPECT_EQ(received, "through the pipe");
    EXPECT_TRUE(fs::is_fifo(pipe));
}

TEST_F(OutputFileTest, DevicesAreWrittenTo) {
    const testing_support::OrdinaryUser user(folder.path());  // who could not take a device away
    EXPECT_EQ(write("/dev/null", "x"), std::nullopt);
    EXPECT_TRUE(fs::is_character_file("/dev/null"));
    EXPECT_THAT(write("/dev/full", "x"), Optional(HasSubstr("No space left on device")));
}

TEST_F(OutputFileTest, AFileThatIsOpenIsWrittenToUnderItsNumber) {
    const std::string file = folder.writeFile("file", "before, ");
    const int descriptor = open(file.c_str(), O_WRONLY);
    struct stat before {
    }, after{};
    fstat(descriptor, &before);
    EXPECT_EQ(write("/dev/fd/" + std::to_string(descriptor), "after"), std::nullopt);
    stat(file.c_str(), &after);
    close(descriptor);
    EXPECT_EQ(contentOf(file), "before, after");
    EXPECT_EQ(before.st_ino, after.st_ino);
}

void ignoreSignal(int) {}

// Asks the program to end as soon as it takes such a request down instead of ending.
void requestEndDuring(const std::atomic<bool>& writing) {
    struct sigaction action {};
    while (writing) {
        sigaction(SIGTERM, nullptr, &action);
        if (action.sa_handler != ignoreSignal) {
            kill(getpid(), SIGTERM);
            return;
        }
    }
}

TEST_F(OutputFileTest, ARequestToEndTheProgramLeavesNothing) {
    const std::string file = folder.writeFile("file", "old");
    const auto previous = std::signal(SIGTERM, ignoreSignal);
    Problem problem;
    // The request may come too late, though hardly ever for so many bytes.
    for (int attempt = 0; attempt < 20 && !problem; ++attempt) {
        folder.writeFile("file", "old");
        std::atomic<bool> writing = true;
        std::thread other([&writing] { requestEndDuring(writing); });
        problem = write(file, std::string(32 << 20, 'x'));
        writing = false;
        other.join();
    }
    std::signal(SIGTERM, previous);
    EXPECT_THAT(problem, Optional(HasSubstr("Interrupted")));
    EXPECT_EQ(contentOf(file), "old");
    EXPECT_THAT(names(), ElementsAre("file"));
}

}  // namespace
