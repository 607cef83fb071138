// Showing items in a file manager, on a real session bus.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/FileReveal.h"
#include "tests/support/DesktopBus.h"

using namespace platform;
using namespace testing_support;
using testing::ElementsAre;
using testing::Eq;
using testing::Optional;

namespace {

class FileReveal : public testing::Test {
  protected:
    static std::optional<std::string> show(const std::string& path) {
        return showInFileManager(URL::fileURLWithPath(path));
    }

    const TemporaryFolder folder_;
    const DesktopBus bus_{folder_.path()};
};

const std::string fileManager = "org.freedesktop.FileManager1";

// A socket at which somebody listens and never says anything.
class SilentBus {
  public:
    explicit SilentBus(const std::string& path) : socket_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(address.sun_path, sizeof address.sun_path - 1);
        EXPECT_EQ(bind(socket_.number(), reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
        EXPECT_EQ(listen(socket_.number(), 8), 0);
    }

  private:
    const FileDescriptor socket_;
};

}  // namespace

TEST_F(FileReveal, TheItemIsSelectedInTheFolderAroundIt) {
    const BusService service(bus_, fileManager);
    EXPECT_EQ(show("/movies/a.mov"), std::nullopt);
    EXPECT_EQ(show("/movies"), std::nullopt);
    EXPECT_THAT(service.calls(), ElementsAre("ShowItems (['file:///movies/a.mov'], '')",
                                             "ShowItems (['file:///movies'], '')"));
}

TEST_F(FileReveal, EveryByteOfThePathArrives) {
    const BusService service(bus_, fileManager);
    EXPECT_EQ(show("/a b/\xff#%?é\n.mov"), std::nullopt);
    EXPECT_THAT(service.calls(), ElementsAre("ShowItems (['file:///a%20b/%FF%23%25%3F%C3%A9%0A.mov'], '')"));
}

TEST_F(FileReveal, WithoutAFileManagerItFails) {
    const auto problem = show("/movies/a.mov");
    ASSERT_TRUE(problem);
    EXPECT_THAT(*problem, testing::HasSubstr(fileManager));
}

TEST_F(FileReveal, AnErrorIsTheAnswer) {
    const BusService service(bus_, fileManager, BusService::Answer::error);
    EXPECT_THAT(show("/movies/a.mov"), Optional(Eq("not today")));
}

TEST_F(FileReveal, AFileManagerThatNeverAnswersIsNotWaitedForForEver) {
    const BusService service(bus_, fileManager, BusService::Answer::never);
    EXPECT_NE(show("/movies/a.mov"), std::nullopt);
    EXPECT_EQ(service.calls().size(), 1u);
}

TEST_F(FileReveal, WithoutABusItFails) {
    const NoDesktopBus none;
    EXPECT_THAT(show("/movies/a.mov"), Optional(Eq("there is no session bus")));
}

TEST_F(FileReveal, ABusThatNeverAnswersIsNotWaitedForForEver) {
    const SilentBus silent(folder_.path("bus"));
    const ScopedEnvironment address("DBUS_SESSION_BUS_ADDRESS", ("unix:path=" + folder_.path("bus")).c_str());
    EXPECT_THAT(show("/movies/a.mov"), Optional(Eq("the session bus does not answer")));
}
