#include "platform/linux/RendererModule.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "tests/support/TemporaryFolder.h"

namespace platform {
namespace {

using testing::HasSubstr;
using testing::ThrowsMessage;

TEST(RendererModule, ThatIsMissingOrNoneIsToldOf) {
    const testing_support::TemporaryFolder folder;
    const std::string missing = folder.path("missing.so");
    const std::string text = folder.writeFile("text.so", "no library");
    for (const auto& [path, reason] : {std::pair(missing, missing), std::pair(text, text),
                                       std::pair(std::string("libm.so.6"), std::string("vexoRenderer"))})
        EXPECT_THAT([path = path] { rendererOfModule(path); },
                    ThrowsMessage<std::runtime_error>(HasSubstr(reason)));
}

TEST(RendererModule, HandsItsRendererToItsOwnVersionAlone) {
    EXPECT_NE(vexoRenderer(VEXO_VERSION), nullptr);
    EXPECT_EQ(vexoRenderer(VEXO_VERSION ".1"), nullptr);
    EXPECT_EQ(vexoRenderer(""), nullptr);
}

}  // namespace
}  // namespace platform
