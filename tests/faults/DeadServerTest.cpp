// A file system whose server never answers. One at a clip holds up a load, one at a folder doesn't.
#include <gmock/gmock.h>
#include <signal.h>

#include <future>

#include "tests/support/DeadMount.h"
#include "tests/support/FileContent.h"
#include "tests/support/Program.h"
#include "tests/support/RunningProgram.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

TEST(DeadServer, DoesNotHideTheHealthyRest) {
    if (const auto reason = DeadMount::reasonAgainst())
        GTEST_SKIP() << *reason;
    const TemporaryFolder home;
    const ScopedEnvironment cache("XDG_CACHE_HOME", home.makeFolder("cache").c_str());
    home.writeFile("Movies/Reelix Events/Event/clip.mov");
    const std::string gone = home.makeFolder("Movies/Reelix Events/gone");
    home.writeFile("Movies/Reelix Events/gone/below the mount.mov");
    home.makeLink("Movies/Reelix Projects", gone + "/Projects");
    {
        const DeadMount mount(gone);
        const auto taken = std::async(std::launch::async, [&mount] { mount.takeRequest(); });
        const Outcome outcome = runVexo({"--home", home.path(), "tree"});
        EXPECT_EQ(outcome.status, 0);
        EXPECT_THAT(outcome.output, AllOf(HasSubstr("clip"), Not(HasSubstr("gone"))));
        EXPECT_THAT(outcome.errors, HasSubstr("cannot look at " + gone + ": Connection timed out"));
    }
    const Outcome healthy = runVexo({"--home", home.path(), "tree"});
    EXPECT_THAT(healthy.output, AllOf(HasSubstr("clip"), HasSubstr("below the mount")));
    EXPECT_EQ(healthy.errors, "");
}

TEST(DeadServer, DoesNotKeepAProgramThatIsToEnd) {
    if (const auto reason = DeadMount::reasonAgainst())
        GTEST_SKIP() << *reason;
    const TemporaryFolder home;
    const ScopedEnvironment cache("XDG_CACHE_HOME", home.makeFolder("cache").c_str());
    const DeadMount mount(home.writeFile("Movies/Reelix Events/Event/clip.mov"));
    RunningProgram watch(VEXO_BIN_DIR "/vexo", {"--home", home.path(), "watch"});
    mount.awaitRequest();  // the load hangs from now on
    watch.send(SIGTERM);
    EXPECT_EQ(watch.wait(), 1);
}

TEST(DeadServer, DoesNotHideWhatWentWrongBefore) {
    if (const auto reason = DeadMount::reasonAgainst())
        GTEST_SKIP() << *reason;
    const TemporaryFolder home;
    const ScopedEnvironment cache("XDG_CACHE_HOME", home.makeFolder("cache").c_str());
    const DeadMount mount(home.writeFile("Movies/Reelix Events/Event/clip.mov"));
    home.writeFile("Movies/Reelix Projects", "a warning, which cannot be written");
    const std::string errors = home.path("errors");
    RunningProgram watch("/bin/sh", {"-c", "exec \"$@\" >/dev/full 2>\"$0\"", errors, VEXO_BIN_DIR "/vexo",
                                     "--quiet", "--home", home.path(), "watch", "--json"});
    mount.awaitRequest();
    EXPECT_EQ(watch.wait(), 1);
    EXPECT_THAT(contentOf(errors), AllOf(StartsWith("vexo: the answer cannot be written"),
                                         HasSubstr("a file system does not answer")));
}

}  // namespace
}  // namespace testing_support
