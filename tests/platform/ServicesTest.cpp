#include "platform/Services.h"

#include <gtest/gtest.h>

#include <stdexcept>
#include <thread>

#include "tests/platform/StandInServices.h"

namespace platform {
namespace {

TEST(ServicesTest, WithoutAScopeThereAreNone) {
    EXPECT_THROW(services(), std::logic_error);
    { const StandInServices inPlace; }
    EXPECT_THROW(services(), std::logic_error);
}

TEST(ServicesTest, TheInnermostScopeCounts) {
    const StandInServices outer;
    EXPECT_EQ(&services().fileManager, &outer.fileManager);
    {
        const StandInServices inner;
        EXPECT_EQ(&services().fileManager, &inner.fileManager);
        EXPECT_EQ(&services().systemLog, &inner.systemLog);
    }
    EXPECT_EQ(&services().fileManager, &outer.fileManager);
}

TEST(ServicesTest, ThreadsStartedInAScopeFindItsServices) {
    const StandInServices inPlace;
    const FileManager* found = nullptr;
    std::thread([&] { found = &services().fileManager; }).join();
    EXPECT_EQ(found, &inPlace.fileManager);
}

}  // namespace
}  // namespace platform
