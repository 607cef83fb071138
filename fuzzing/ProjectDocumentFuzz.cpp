// The plug-in's question whether a project is a trailer, with any bytes for the project's document. A
// document that is refused raises; counted as unreadable it is told of once and is no trailer. One that isn't
// refused answers the same either way.
#include <cstdint>
#include <optional>

#include "core/VXReelixPlugin.h"
#include "fuzzing/OneFile.h"
#include "fuzzing/Require.h"

namespace {

// nil for a document that is refused.
std::optional<bool> answerThatMayRaise(reelix::VXReelixPlugin& plugin) {
    try {
        return plugin._isTrailer("/project");
    } catch (const platform::ArchiveError&) {
        return std::nullopt;
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const PlatformWithOneFile platform({data, size});
    reelix::VXReelixPlugin plugin(nullptr);
    const std::optional<bool> answer = answerThatMayRaise(plugin);

    int reportCount = 0;
    const platform::RejectedArchivesAsUnreadable scope(
        [](const platform::ArchiveError&, void* count) { ++*static_cast<int*>(count); }, &reportCount);
    require(plugin._isTrailer("/project") == answer.value_or(false));
    require(reportCount == (answer ? 0 : 1));
    return 0;
}
