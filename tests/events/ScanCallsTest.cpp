// How many calls to the system a scan makes for a clip. The library's calls of statx and getxattr come
// through here, are counted and go on to the kernel.
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <atomic>

#include "framework/metadata/MetadataStore.h"
#include "tests/support/PluginTest.h"

namespace {

std::atomic<int> looks = 0;
std::atomic<int> attributeReads = 0;

}  // namespace

extern "C" int statx(int folder, const char* path, int flags, unsigned mask, struct statx* status) noexcept {
    ++looks;
    return static_cast<int>(syscall(SYS_statx, folder, path, flags, mask, status));
}

extern "C" ssize_t getxattr(const char* path, const char* name, void* value, size_t size) noexcept {
    ++attributeReads;
    return syscall(SYS_getxattr, path, name, value, size);
}

namespace testing_support {
namespace {

struct Calls {
    int looks;
    int attributeReads;
};

class ScanCallsTest : public PluginTest {
  protected:
    std::string library() const { return home().path("Movies/Reelix Events"); }
    void addClips(int count) {
        for (int i = 0; i < count; ++i)
            home().writeFile("Movies/Reelix Events/Trip/" + std::to_string(clips_++) + ".mov");
    }
    Calls callsOfAScan() {
        const Calls before{looks, attributeReads};
        platform::Locked monitor(plugin()._monitor);
        plugin()._flatEventGroupsList = std::make_unique<ExposedPlugin::Groups>();
        const auto scanned = plugin()._createReelixEventsFolderForPath(library());
        EXPECT_EQ(scanned->mediaObjects().size(), static_cast<std::size_t>(clips_));
        return {looks - before.looks, attributeReads - before.attributeReads};
    }

  private:
    // The real one: what the host looks at counts as well.
    const vexo::MetadataStore metadata_{std::nullopt, nullptr};
    const vexo::HostServices& host_ = vexo::hostServices();
    const vexo::HostServicesScope scope_{
        {host_.pathWatcher, host_.imageManager, metadata_, host_.thumbnails, host_.diagnostics}};
    int clips_ = 0;
};

TEST_F(ScanCallsTest, AClipTakesOneLookAndOneReadOfItsAttribute) {
    addClips(100);
    const Calls few = callsOfAScan();
    addClips(200);
    const Calls many = callsOfAScan();
    EXPECT_EQ(many.looks - few.looks, 200);
    EXPECT_EQ(many.attributeReads - few.attributeReads, 200);
    EXPECT_GT(few.looks, 100);
}

}  // namespace
}  // namespace testing_support
