// Which failures of the file system people are told of.
#include "framework/WarningLog.h"

#include <gmock/gmock.h>

#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

using testing::ElementsAre;

class WarningLogTest : public testing::Test {
  protected:
    testing_support::RecordingLog log_;
    Diagnostics diagnostics_{log_, Verbosity::normal};
    WarningLog warnings_{diagnostics_};
};

TEST_F(WarningLogTest, OfAPathTheFirstFailureIsAWarningAndTheOthersAreLogged) {
    warnings_.log("cannot look at /a: b: Permission denied");
    warnings_.log("cannot list /a: b: Permission denied");
    warnings_.log("cannot list /a: Permission denied");
    EXPECT_THAT(diagnostics_.warnings(),
                ElementsAre("cannot look at /a: b: Permission denied", "cannot list /a: Permission denied"));
    EXPECT_EQ(log_.lines().size(), 3u);
}

TEST_F(WarningLogTest, LinesThatNameNoPathAreWarnings) {
    warnings_.log("one");
    warnings_.log("another: one");
    warnings_.log("one");
    EXPECT_THAT(diagnostics_.warnings(), ElementsAre("one", "another: one"));
}

}  // namespace
}  // namespace vexo
