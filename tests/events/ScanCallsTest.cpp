// How many calls to the system a scan makes for a clip. The library's calls of statx, getxattr and, for what
// the C library does not name, syscall come through here, are counted and go on to the kernel.
#include <dlfcn.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstdarg>
#include <cstdlib>

#include "events/EventOrder.h"
#include "framework/metadata/MetadataStore.h"
#include "tests/support/PluginTest.h"

namespace {

constexpr long getxattratNumber = 464;

std::atomic<int> looks = 0;
std::atomic<int> attributeReads = 0;
std::atomic<bool> isOldKernel = false;  // one before 6.13

long next(long number, long a, long b, long c, long d, long e, long f) {
    using SystemCall = long (*)(long, ...);
    static const auto call = reinterpret_cast<SystemCall>(dlsym(RTLD_NEXT, "syscall"));
    return call(number, a, b, c, d, e, f);
}

}  // namespace

extern "C" int statx(int folder, const char* path, int flags, unsigned mask, struct statx* status) noexcept {
    ++looks;
    return static_cast<int>(next(SYS_statx, folder, reinterpret_cast<long>(path), flags, mask,
                                 reinterpret_cast<long>(status), 0));
}

extern "C" ssize_t getxattr(const char* path, const char* name, void* value, size_t size) noexcept {
    ++attributeReads;
    return next(SYS_getxattr, reinterpret_cast<long>(path), reinterpret_cast<long>(name),
                reinterpret_cast<long>(value), static_cast<long>(size), 0, 0);
}

extern "C" long syscall(long number, ...) noexcept {
    va_list list;
    va_start(list, number);
    long arguments[6];
    for (long& argument : arguments)
        argument = va_arg(list, long);
    va_end(list);
    if (number == getxattratNumber && isOldKernel) {
        errno = ENOSYS;
        return -1;
    }
    const long result =
        next(number, arguments[0], arguments[1], arguments[2], arguments[3], arguments[4], arguments[5]);
    attributeReads += number == getxattratNumber && !(result < 0 && errno == ENOSYS);
    return result;
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
    // Each name begins as given and ends in a number of two digits.
    void addClips(int count, const std::string& name, const std::string& event = "Trip") {
        for (int i = 0; i < count; ++i, ++clips_)
            home().writeFile("Movies/Reelix Events/" + event + "/" + name + std::to_string(10 + i) + ".mov");
    }
    Calls callsOfAScan() {
        const Calls before{looks, attributeReads};
        platform::Locked monitor(plugin()._monitor);
        plugin()._flatEventGroupsList = std::make_unique<ExposedPlugin::Groups>();
        ExposedPlugin::OrderedEvents events;
        const auto scanned = plugin()._createReelixEventsFolderForPath(library(), events);
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

TEST_F(ScanCallsTest, AClipWithADateInItsNameTakesOneReadOfItsAttribute) {
    addClips(20, "clip-2009-07-01 08;30;");
    const Calls few = callsOfAScan();
    addClips(40, "clip-2009-07-01 09;30;");
    const Calls many = callsOfAScan();
    EXPECT_EQ(many.looks, few.looks);
    EXPECT_EQ(many.attributeReads - few.attributeReads, 40);
    EXPECT_GE(few.attributeReads, 20);
}

TEST_F(ScanCallsTest, AClipWithoutADateTakesALookAtItsCreationDateAsWell) {
    addClips(20, "one ");
    const Calls few = callsOfAScan();
    addClips(40, "another ");
    const Calls many = callsOfAScan();
    EXPECT_EQ(many.looks - few.looks, 40);
    EXPECT_EQ(many.attributeReads - few.attributeReads, 40);
    EXPECT_GE(few.looks, 20);
}

// Whether a file system knows the names of foreign drivers' attributes is asked once for all its folders.
TEST_F(ScanCallsTest, AnEventTakesOneLookAndNoReadBesideThoseOfItsClips) {
    addClips(1, "one ");
    const Calls one = callsOfAScan();
    for (int i = 0; i < 10; ++i)
        addClips(1, "clip-2009-07-01 08;30;", "Trip " + std::to_string(i));
    const Calls many = callsOfAScan();
    EXPECT_EQ(many.looks - one.looks, 10);
    EXPECT_EQ(many.attributeReads - one.attributeReads, 10);
}

// In a process of its own: what a kernel can do is found out once.
TEST_F(ScanCallsTest, AnOldKernelIsAskedByPathAsOften) {
    addClips(20, "one ");
    setExtendedAttribute(home().path("Movies/Reelix Events/Trip/one 10.mov"), "user.date",
                         "2009-07-01 08;30;00");
    const Calls calls = callsOfAScan();
    const auto scanAsOldKernel = [&] {
        isOldKernel = true;
        const Calls byPath = callsOfAScan();
        std::exit(byPath.looks == calls.looks && byPath.attributeReads == calls.attributeReads ? 0 : 1);
    };
    EXPECT_EXIT(scanAsOldKernel(), testing::ExitedWithCode(0), "");
}

}  // namespace
}  // namespace testing_support
