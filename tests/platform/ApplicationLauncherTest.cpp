// Launching applications for real: programs that tell of themselves, and services on a bus.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/stat.h>

#include "platform/linux/LinuxWorkspace.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/DesktopBus.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/Mailbox.h"

using namespace platform;
using namespace testing_support;
using testing::AllOf;
using testing::ElementsAre;
using testing::Eq;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;

namespace {

const std::string identifier = "com.norvale.ReelixApp";

class ApplicationLaunch : public testing::Test {
  protected:
    ApplicationLaunch() {
        workspace_.notificationCenter().addObserver(
            observer_, VXWorkspaceDidFailNotification, [this](const Notification& notification) {
                posted_.push_back(*find(notification.userInfo, "problem")->string());
            });
    }

    // `folder` is "home" or "system", the first of which wins.
    void addEntry(const std::string& keys, const std::string& folder = "home") {
        folder_.writeFile(folder + "/applications/" + identifier + ".desktop",
                          "[Desktop Entry]\nType=Application\nName=Test\n" + keys);
    }
    // A program that writes what the shell makes of `words` into the mailbox.
    std::string addProgram(const std::string& name, const std::string& words) {
        const auto path = folder_.writeFile(
            "bin/" + name, "#!/bin/sh\necho \"" + words + "\" > '" + mailbox_.path() + "'\n");
        chmod(path.c_str(), 0755);
        return path;
    }
    bool launch() { return workspace_.launchAppWithBundleIdentifier(identifier, NSWorkspaceLaunchAsync); }
    // That a launch failed, and was told of as it must.
    void expectFailure(const std::string& reason) {
        EXPECT_FALSE(launch());
        EXPECT_THAT(log_.lines(), ElementsAre(AllOf(HasSubstr(identifier), HasSubstr(reason))));
        EXPECT_EQ(posted_, log_.lines());
    }

    const TemporaryFolder folder_;
    const ScopedEnvironment home_{"XDG_DATA_HOME", folder_.path("home").c_str()};
    const ScopedEnvironment system_{"XDG_DATA_DIRS", folder_.path("system").c_str()};
    Mailbox mailbox_{folder_.path("mailbox")};
    const DesktopBus bus_{folder_.makeFolder("services")};
    CollectedLog log_;
    FakeMountTable mounts_;
    LinuxWorkspace workspace_{mounts_, log_};

  private:
    const std::shared_ptr<int> observer_ = std::make_shared<int>();
    std::vector<std::string> posted_;
};

}  // namespace

TEST_F(ApplicationLaunch, StartsTheProgramOfTheEntry) {
    addEntry("Exec=" + addProgram("reelix", "started with $#") + " %U\n");
    EXPECT_TRUE(launch());
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("started with 0")));
    EXPECT_THAT(log_.lines(), IsEmpty());
}

TEST_F(ApplicationLaunch, TheEntryThatIsFoundIsTheOneThatIsLaunched) {
    addEntry("Exec=" + addProgram("theirs", "theirs") + "\n", "system");
    addEntry("Exec=" + addProgram("mine", "mine") + "\n", "home");
    EXPECT_EQ(workspace_.absolutePathForAppBundleWithIdentifier(identifier), folder_.path("bin/mine"));
    EXPECT_TRUE(launch());
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("mine")));
}

TEST_F(ApplicationLaunch, AProgramIsStartedWithoutABusToo) {
    const NoDesktopBus none;
    addEntry("DBusActivatable=true\nExec=" + addProgram("reelix", "started") + "\n");
    EXPECT_TRUE(launch());
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("started")));
}

TEST_F(ApplicationLaunch, AProgramGetsNeitherOurInputNorOutput) {
    const std::string standardFiles = "$(readlink /proc/$$/fd/0 /proc/$$/fd/1 /proc/$$/fd/2 | tr '\\n' ' ')";
    addEntry("Exec=" + addProgram("reelix", standardFiles) + "\n");
    EXPECT_TRUE(launch());
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("/dev/null /dev/null /dev/null ")));
}

TEST_F(ApplicationLaunch, AProgramGetsNoFileThatWeHaveOpen) {
    const FileDescriptor secret(open(folder_.writeFile("secret").c_str(), O_RDONLY));
    addEntry("Exec=" + addProgram("reelix", "$(readlink /proc/$$/fd/* | grep -c secret)") + "\n");
    EXPECT_TRUE(launch());
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("0")));
}

TEST_F(ApplicationLaunch, AProgramHasASessionOfItsOwn) {
    addEntry("Exec=" + addProgram("reelix", "$(cut -d ' ' -f 6 /proc/$$/stat)") + "\n");
    EXPECT_TRUE(launch());
    const auto session = mailbox_.nextLine();
    ASSERT_TRUE(session);
    EXPECT_GT(std::stol(*session), 0);
    EXPECT_NE(std::stol(*session), getsid(0));
}

TEST_F(ApplicationLaunch, AProgramHearsTheSignalsThatWeBlock) {
    addEntry("Exec=" + addProgram("reelix", "$(grep SigBlk /proc/$$/status | tr -d '\\t')") + "\n");
    sigset_t some, before;
    sigemptyset(&some);
    sigaddset(&some, SIGUSR1);
    pthread_sigmask(SIG_BLOCK, &some, &before);
    EXPECT_TRUE(launch());
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("SigBlk:0000000000000000")));
}

TEST_F(ApplicationLaunch, AnApplicationThatIsNotInstalledIsAFailure) {
    expectFailure("no such application");
}

TEST_F(ApplicationLaunch, AnEntryWhoseProgramIsGoneIsAFailure) {
    addEntry("Exec=" + folder_.path("gone") + "\n");
    expectFailure("no program that is installed");
}

TEST_F(ApplicationLaunch, AnApplicationOfTheBusIsActivatedThere) {
    const BusService application(bus_, identifier);
    addEntry("DBusActivatable=true\nExec=" + addProgram("reelix", "started") + "\n");
    EXPECT_TRUE(launch());
    EXPECT_THAT(application.calls(), ElementsAre(testing::StartsWith("Activate ")));
}

TEST_F(ApplicationLaunch, AnApplicationOfTheBusNeedsNoProgram) {
    const BusService application(bus_, identifier);
    addEntry("DBusActivatable=true\n");
    EXPECT_EQ(workspace_.absolutePathForAppBundleWithIdentifier(identifier),
              folder_.path("home/applications/" + identifier + ".desktop"));
    EXPECT_TRUE(launch());
    EXPECT_EQ(application.calls().size(), 1u);
}

TEST_F(ApplicationLaunch, AnApplicationThatTheBusDoesNotKnowIsAFailure) {
    addEntry("DBusActivatable=true\n");
    expectFailure("was not provided by any .service files");
}

TEST_F(ApplicationLaunch, AnApplicationThatRefusesIsAFailure) {
    const BusService application(bus_, identifier, BusService::Answer::error);
    addEntry("DBusActivatable=true\n");
    expectFailure("not today");
}

TEST_F(ApplicationLaunch, WhatIsRefusedLaterIsToldOfWhenTheWaitIsOver) {
    addEntry("DBusActivatable=true\n");
    const auto pipe = folder_.makeFifo("go");
    folder_.writeFile(
        "services/reelix.service",
        "[D-BUS Service]\nName=" + identifier + "\nExec=/bin/sh -c \"read go < '" + pipe + "'; exit 1\"\n");
    EXPECT_TRUE(launch());
    EXPECT_THAT(log_.lines(), IsEmpty());
    const FileDescriptor go(open(pipe.c_str(), O_WRONLY | O_CLOEXEC));
    EXPECT_EQ(write(go.number(), "\n", 1), 1);
    workspace_.waitUntilLaunched();
    EXPECT_THAT(log_.lines(), ElementsAre(HasSubstr("exited with status 1")));
}
