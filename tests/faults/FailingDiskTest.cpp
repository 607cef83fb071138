// Disks that are full, may not be written to, or can't be read any more.
#include <gmock/gmock.h>
#include <sys/mount.h>

#include <filesystem>
#include <fstream>

#include "framework/metadata/MetadataIndex.h"
#include "framework/thumbnails/ThumbnailCache.h"
#include "tests/faults/FaultsTest.h"
#include "tests/projects/ProjectsTest.h"
#include "tests/support/LoopImage.h"
#include "tests/support/RunningProgram.h"

namespace testing_support {
namespace {

namespace fs = std::filesystem;
using testing::Contains;
using testing::HasSubstr;

// A file system in memory of half a megabyte.
class SmallDisk {
  public:
    explicit SmallDisk(std::string mountPoint) : mountPoint_(std::move(mountPoint)) {
        if (mount("memory", mountPoint_.c_str(), "tmpfs", 0, "size=512k") != 0)
            throw std::runtime_error("cannot mount at " + mountPoint_);
    }
    ~SmallDisk() { umount2(mountPoint_.c_str(), MNT_DETACH); }
    SmallDisk(const SmallDisk&) = delete;
    SmallDisk& operator=(const SmallDisk&) = delete;

    void fill() const {
        std::ofstream file(filler(), std::ios::binary);
        while (file << std::string(4096, 'x') << std::flush) {
        }
    }
    void makeRoom() const { fs::remove(filler()); }
    void forbidWriting() const {
        if (mount(nullptr, mountPoint_.c_str(), nullptr, MS_REMOUNT | MS_RDONLY, nullptr) != 0)
            throw std::runtime_error("cannot make read-only: " + mountPoint_);
    }

  private:
    std::string filler() const { return mountPoint_ + "/filler"; }

    const std::string mountPoint_;
};

class FullDisk : public testing::Test {
  protected:
    void SetUp() override {
        if (const auto reason = reasonAgainstMounting())
            GTEST_SKIP() << *reason;
        disk.emplace(mountPoint);
    }

    std::vector<std::string> files() const {
        std::vector<std::string> names;
        for (const auto& entry : fs::recursive_directory_iterator(mountPoint))
            if (entry.is_regular_file())
                names.push_back(entry.path().lexically_relative(mountPoint));
        return names;
    }

    const TemporaryFolder folder;
    const std::string mountPoint = folder.makeFolder("disk");
    std::optional<SmallDisk> disk;
};

TEST_F(FullDisk, HoldsNoHalfThumbnails) {
    const vexo::ThumbnailCache cache(mountPoint + "/thumbnails");
    const vexo::ThumbnailSubject first{"file:///a.mov", 1'000'000'000, 1}, second{"file:///b.mov", 1, 2};
    const platform::Bitmap picture{128, 72, std::vector<std::uint32_t>(128 * 72, 0xffff0000)};
    cache.store(first, vexo::ThumbnailSize::normal, picture);
    disk->fill();
    const auto before = files();
    cache.store(second, vexo::ThumbnailSize::normal, picture);
    cache.storeFailure(second);
    EXPECT_EQ(files(), before);
    EXPECT_TRUE(cache.find(first, vexo::ThumbnailSize::normal));
    EXPECT_FALSE(cache.find(second, vexo::ThumbnailSize::normal));
    disk->makeRoom();
    cache.store(second, vexo::ThumbnailSize::normal, picture);
    EXPECT_TRUE(cache.find(second, vexo::ThumbnailSize::normal));
}

TEST_F(FullDisk, KeepsWhatTheIndexKnewAndTakesMoreOnceThereIsRoom) {
    const std::string path = mountPoint + "/metadata.sqlite";
    const vexo::MediaReaderAnswer unreadable = vexo::MediaFailure{"no movie", vexo::FailureCause::file};
    vexo::MetadataIndex index(path);
    index.store({1, 2, 3, 4}, unreadable);
    disk->fill();
    for (std::uint64_t inode = 1000; inode < 1200; ++inode)
        index.store({1, inode, 3, 4}, unreadable);
    EXPECT_EQ(index.find({1, 2, 3, 4}), unreadable);
    EXPECT_EQ(vexo::MetadataIndex(path).find({1, 2, 3, 4}), unreadable);
    disk->makeRoom();
    index.store({1, 5000, 3, 4}, unreadable);
    EXPECT_EQ(vexo::MetadataIndex(path).find({1, 5000, 3, 4}), unreadable);
}

TEST(ReadOnlyHome, IsBrowsedAsAnyOther) {
    if (const auto reason = reasonAgainstMounting())
        GTEST_SKIP() << *reason;
    const TemporaryFolder folder;
    const std::string home = folder.makeFolder("home");
    const SmallDisk disk(home);
    folder.writeFile("home/Movies/Reelix Events/Beach/clip.mov", "no movie");
    disk.forbidWriting();
    const ScopedEnvironment homeVariable("HOME", home.c_str());
    const ScopedEnvironment cache("XDG_CACHE_HOME", nullptr), configuration("XDG_CONFIG_HOME", nullptr);
    RunningProgram tree(VEXO_BIN_DIR "/vexo", {"tree", "--metadata"});
    std::string output;
    while (const auto line = tree.nextLine())
        output += *line + "\n";
    EXPECT_THAT(output, HasSubstr("Beach"));
    EXPECT_EQ(tree.wait(), 0);
}

// A folder of projects on a disk of its own.
class UnreadableDisk : public FaultsTest {
  protected:
    UnreadableDisk() : FaultsTest(Documents::allWell) {}
    void SetUp() override {
        if (const auto reason = reasonAgainstMounting("ext4"))
            GTEST_SKIP() << *reason;
        mountPoint = home().makeFolder("Movies/Reelix Projects/Disk");
        disk.emplace(home().path("disk.img"), "Disk");
        const ScopedMount mount = disk->mountAt(mountPoint);
        home().writeFile("Movies/Reelix Projects/Disk/Lost.qnproject/Project", plainDocument());
        home().writeFile("Movies/Reelix Projects/Disk/Lost.qnproject/Movies/lost.mov", "movie");
    }

    // All but the first blocks of the disk can't be read from now on, as far as nobody has read them.
    void breakDisk() const { fs::resize_file(home().path("disk.img"), 64 * 1024); }

    std::string mountPoint;
    std::optional<LoopImage> disk;
};

TEST_F(UnreadableDisk, HidesNothingButItself) {
    const TreeEntries others = loadTree();
    ASSERT_TRUE(others.contains({mountPoint, ""}));
    const ScopedMount mount = disk->mountAt(mountPoint);
    breakDisk();
    EXPECT_EQ(loadTree(), others);
    EXPECT_THAT(environment.log.lines(), Contains(HasSubstr(mountPoint)));
}

TEST_F(UnreadableDisk, ThatIsKnownInPartShowsThat) {
    const ScopedMount mount = disk->mountAt(mountPoint);
    const TreeEntries whole = loadTree();
    ASSERT_TRUE(whole.contains({mountPoint + "/Lost.qnproject", ""}));
    breakDisk();
    home().writeFile("Movies/Reelix Projects/Summer.qnproject/Movies/new.mov", "the longest of them all");
    const TreeEntries tree = reloadTree();
    EXPECT_TRUE(
        tree.contains({projects() + "/Summer.qnproject", projects() + "/Summer.qnproject/Movies/new.mov"}));
    expectHealthyRest(tree, reloadTree(), mountPoint);
}

}  // namespace
}  // namespace testing_support
