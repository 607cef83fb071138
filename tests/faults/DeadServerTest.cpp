// A file system whose server never answers.
#include <gmock/gmock.h>
#include <signal.h>

#include "tests/support/DeadMount.h"
#include "tests/support/FileContent.h"
#include "tests/support/RunningProgram.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;

TEST(DeadServer, DoesNotKeepAProgramThatIsToEnd) {
    if (const auto reason = DeadMount::reasonAgainst())
        GTEST_SKIP() << *reason;
    const TemporaryFolder home;
    const ScopedEnvironment cache("XDG_CACHE_HOME", home.makeFolder("cache").c_str());
    const DeadMount mount(home.makeFolder("Movies/Reelix Events/gone"));
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
    const DeadMount mount(home.makeFolder("Movies/Reelix Events/gone"));
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
