// A file system whose server never answers.
#include <gtest/gtest.h>
#include <signal.h>

#include "tests/support/DeadMount.h"
#include "tests/support/LoopImage.h"
#include "tests/support/RunningProgram.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

TEST(DeadServer, DoesNotKeepAProgramThatIsToEnd) {
    if (const auto reason = reasonAgainstMounting())
        GTEST_SKIP() << *reason;
    const TemporaryFolder home;
    const ScopedEnvironment cache("XDG_CACHE_HOME", home.makeFolder("cache").c_str());
    const DeadMount mount(home.makeFolder("Movies/Reelix Events/gone"));
    RunningProgram watch(VEXO_BIN_DIR "/vexo", {"--home", home.path(), "watch"});
    mount.awaitRequest();  // the load hangs from now on
    watch.send(SIGTERM);
    EXPECT_EQ(watch.wait(), 1);
}

}  // namespace
}  // namespace testing_support
