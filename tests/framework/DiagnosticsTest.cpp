#include "framework/Diagnostics.h"

#include <gmock/gmock.h>

#include <stdexcept>

#include "tests/support/HostEnvironment.h"

namespace vexo {
namespace {

using testing::ElementsAre;
using testing::SizeIs;

class DiagnosticsTest : public testing::Test {
  protected:
    testing_support::RecordingLog log;
    Diagnostics diagnostics{log, Verbosity::normal};
};

TEST_F(DiagnosticsTest, AnObserverThatRaisesHarmsNobody) {
    const auto owner = std::make_shared<int>();
    diagnostics.addWarningObserver(owner, [](const std::string&) { throw std::runtime_error("deaf"); });
    EXPECT_NO_THROW(diagnostics.warn("one"));
    EXPECT_THAT(diagnostics.warnings(), ElementsAre("one"));
}

TEST_F(DiagnosticsTest, AWarningIsToldOnce) {
    std::vector<std::string> heard;
    const auto owner = std::make_shared<int>();
    diagnostics.addWarningObserver(owner, [&](const std::string& warning) { heard.push_back(warning); });
    for (const char* warning : {"one", "two", "one"})
        diagnostics.warn(warning);
    EXPECT_THAT(diagnostics.warnings(), ElementsAre("one", "two"));
    EXPECT_THAT(log.lines(), ElementsAre("one", "two"));
    EXPECT_THAT(heard, ElementsAre("one", "two"));
}

TEST_F(DiagnosticsTest, BeyondTheMostAreToldToBeLeftOut) {
    for (std::size_t i = 0; i < Diagnostics::mostWarnings + 10; ++i)
        diagnostics.warn(std::to_string(i));
    const auto warnings = diagnostics.warnings();
    ASSERT_THAT(warnings, SizeIs(Diagnostics::mostWarnings + 1));
    EXPECT_EQ(warnings[Diagnostics::mostWarnings - 1], std::to_string(Diagnostics::mostWarnings - 1));
    EXPECT_EQ(warnings.back(), "there are more warnings, which are left out");
    EXPECT_EQ(log.lines(), warnings);
}

TEST_F(DiagnosticsTest, KnownWarningsDoNotCountAgain) {
    for (std::size_t i = 0; i < 2 * Diagnostics::mostWarnings; ++i)
        diagnostics.warn("again");
    diagnostics.warn("new");
    EXPECT_THAT(diagnostics.warnings(), ElementsAre("again", "new"));
}

}  // namespace
}  // namespace vexo
