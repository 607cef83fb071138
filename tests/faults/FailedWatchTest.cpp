// Each single call to the system that arming a watch makes fails once: what changes in every folder is heard
// nevertheless, if need be because the folder is looked at now and then.
#include <gmock/gmock.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>

#include "tests/faults/SmallLibrary.h"
#include "tests/faults/SystemCalls.h"
#include "tests/pathwatcher/WatcherTest.h"

namespace testing_support {
namespace {

class FailedWatch : public WatcherTest {
  protected:
    FailedWatch() {
        for (const std::string& each : folders)
            folder.makeFolder(each);
    }

    // False when arming the watches takes no call of that number. The watcher knows nothing of earlier ones.
    bool armWithFailureAt(std::size_t index, int error) {
        startAnew();
        SystemCalls calls(folder.path());
        calls.failAt(index, error);
        watch(folder.path("Movies"));
        if (calls.calls().size() <= index)
            return false;
        failed = calls.calls()[index];
        return true;
    }
    // Of these folders, those in which a change is never heard.
    Paths deaf(const std::vector<std::string>& changed) {
        observer->calls.clear();
        for (const std::string& each : changed)
            folder.makeFolder(each + "/new");
        Paths unheard;
        settleUntil([&] {
            unheard = pathsOf(changed);
            std::erase_if(unheard, [this](const std::string& path) { return wasHeardOf(path); });
            return unheard.empty();
        });
        for (const std::string& each : changed)
            folder.remove(each + "/new");
        return unheard;
    }
    // A report is of all that is below its folder.
    bool wasHeardOf(const std::string& path) const {
        return std::any_of(observer->calls.begin(), observer->calls.end(),
                           [&](const std::string& reported) { return isAtOrBelow(path, reported); });
    }
    Paths pathsOf(const std::vector<std::string>& names) const {
        Paths paths;
        for (const std::string& name : names)
            paths.insert(folder.path(name));
        return paths;
    }
    std::vector<std::string> foldersElsewhere() const {
        std::vector<std::string> elsewhere;
        for (const std::string& each : folders) {
            if (!isAtOrBelow(folder.path(each), failed.path))
                elsewhere.push_back(each);
        }
        return elsewhere;
    }
    std::string description(std::size_t index, int error) const {
        return std::to_string(index) + ": " + failed.function + " of " + failed.path + ": " +
               std::strerror(error);
    }

    const std::vector<std::string> folders{"Movies", "Movies/a", "Movies/a/deep", "Movies/b",
                                           "Movies/b/deep"};
    SystemCall failed;
};

TEST_F(FailedWatch, ForWantOfSomethingHidesNoChange) {
    constexpr std::array errors{ENOSPC, ENOMEM, EMFILE, EIO};
    std::size_t index = 0;
    while (armWithFailureAt(index, errors[index % errors.size()])) {
        SCOPED_TRACE(description(index, errors[index % errors.size()]));
        ++index;
        ASSERT_EQ(deaf(folders), Paths());
    }
    EXPECT_GT(index, 10u);
}

TEST_F(FailedWatch, BecauseOfTheFolderHidesNoChangeElsewhere) {
    constexpr std::array errors{EACCES, ENOENT, ELOOP, ENAMETOOLONG, ENOTDIR};
    std::size_t index = 0;
    while (armWithFailureAt(index, errors[index % errors.size()])) {
        SCOPED_TRACE(description(index, errors[index % errors.size()]));
        ++index;
        ASSERT_EQ(deaf(foldersElsewhere()), Paths());
    }
    EXPECT_GT(index, 10u);
}

TEST_F(FailedWatch, ThatWasInterruptedIsMadeAgain) {
    std::size_t index = 0;
    while (armWithFailureAt(index, EINTR)) {
        SCOPED_TRACE(description(index++, EINTR));
        ASSERT_EQ(deaf(folders), Paths());
    }
}

}  // namespace
}  // namespace testing_support
