#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

#include "platform/linux/LinuxUserDefaults.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace testing_support;
using testing::ElementsAre;
using testing::Eq;
using testing::HasSubstr;
using testing::Optional;

namespace {

std::string preferences(const std::string& key, const std::string& text) {
    return R"(<?xml version="1.0" encoding="UTF-8"?><plist version="1.0"><dict><key>)" + key +
           "</key><string>" + text + "</string></dict></plist>";
}

class LinuxUserDefaultsTest : public testing::Test {
  protected:
    void write(const std::string& domain, const std::string& content) {
        folder_.writeFile(domain + ".plist", content);
    }
    std::optional<std::string> text(std::string_view domain, std::string_view key) {
        const auto dictionary = defaults_.persistentDomainForName(domain);
        const Value* const value = dictionary ? find(*dictionary, key) : nullptr;
        return value && value->string() ? std::optional(*value->string()) : std::nullopt;
    }

    const TemporaryFolder folder_;
    CollectedLog log_;
    LinuxUserDefaults defaults_{folder_.path(), "com.vexo.browser", &log_};
};

}  // namespace

TEST_F(LinuxUserDefaultsTest, ADomainIsItsFile) {
    EXPECT_EQ(defaults_.pathForDomain("com.vexo.suite"), folder_.path("com.vexo.suite.plist"));
    write("com.vexo.suite", preferences("folder", "/srv/events"));
    EXPECT_THAT(text("com.vexo.suite", "folder"), Optional(Eq("/srv/events")));
}

TEST_F(LinuxUserDefaultsTest, EditsShowAfterSynchronize) {
    write("com.vexo.suite", preferences("folder", "old"));
    EXPECT_THAT(text("com.vexo.suite", "folder"), Optional(Eq("old")));
    write("com.vexo.suite", preferences("folder", "new"));
    EXPECT_THAT(text("com.vexo.suite", "folder"), Optional(Eq("old")));
    defaults_.synchronize();
    EXPECT_THAT(text("com.vexo.suite", "folder"), Optional(Eq("new")));
    folder_.remove("com.vexo.suite.plist");
    defaults_.synchronize();
    EXPECT_EQ(defaults_.persistentDomainForName("com.vexo.suite"), std::nullopt);
}

TEST_F(LinuxUserDefaultsTest, AMissingFileIsNoTrouble) {
    EXPECT_EQ(defaults_.persistentDomainForName("com.vexo.suite"), std::nullopt);
    EXPECT_EQ(defaults_.objectForKey("anything"), std::nullopt);
    EXPECT_THAT(log_.lines(), ElementsAre());
}

TEST_F(LinuxUserDefaultsTest, AnUnusableFileIsNoPreferencesAndOneLine) {
    write("broken", "this is no property list");
    write("list", "<plist version=\"1.0\"><array/></plist>");
    folder_.makeFifo("fifo.plist");
    for (const char* const domain : {"broken", "list", "fifo"}) {
        EXPECT_EQ(defaults_.persistentDomainForName(domain), std::nullopt);
        EXPECT_EQ(defaults_.persistentDomainForName(domain), std::nullopt);
    }
    EXPECT_THAT(log_.lines(),
                ElementsAre(HasSubstr("cannot read the preferences " + folder_.path("broken.plist") + ": "),
                            Eq("cannot read the preferences " + folder_.path("list.plist") +
                               ": no dictionary at the top"),
                            HasSubstr("cannot read the preferences " + folder_.path("fifo.plist") + ": ")));
}

TEST_F(LinuxUserDefaultsTest, AnEnormousFileIsRefused) {
    write("com.vexo.suite", preferences("folder", std::string(16 * 1024 * 1024, 'x')));
    EXPECT_EQ(defaults_.persistentDomainForName("com.vexo.suite"), std::nullopt);
    EXPECT_EQ(log_.lines().size(), 1u);
}

TEST_F(LinuxUserDefaultsTest, ADomainIsNoPath) {
    const TemporaryFolder elsewhere;
    elsewhere.writeFile("a.plist", preferences("key", "value"));
    EXPECT_EQ(defaults_.persistentDomainForName("../" + elsewhere.path().substr(5) + "/a"), std::nullopt);
    EXPECT_EQ(defaults_.persistentDomainForName(""), std::nullopt);
}

TEST_F(LinuxUserDefaultsTest, WhatIsSetForTheProcessWinsOverItsFile) {
    write("com.vexo.browser", preferences("library", "from the file"));
    EXPECT_EQ(defaults_.objectForKey("library"), Value("from the file"));
    defaults_.setForProcess("library", "from the command line");
    EXPECT_EQ(defaults_.objectForKey("library"), Value("from the command line"));
    defaults_.synchronize();
    EXPECT_EQ(defaults_.objectForKey("library"), Value("from the command line"));
    EXPECT_THAT(text("com.vexo.browser", "library"), Optional(Eq("from the file")));
}

TEST_F(LinuxUserDefaultsTest, AnyThreadMayAskAndSynchronize) {
    write("com.vexo.suite", preferences("folder", "/srv/events"));
    std::atomic<int> found = 0;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread)
        threads.emplace_back([&] {
            for (int i = 0; i < 100; ++i) {
                found += text("com.vexo.suite", "folder") == "/srv/events";
                defaults_.synchronize();
            }
        });
    for (auto& thread : threads)
        thread.join();
    EXPECT_EQ(found, 400);
}

TEST_F(LinuxUserDefaultsTest, NobodyNeedsToListen) {
    write("broken", "x");
    LinuxUserDefaults silent(folder_.path(), "broken");
    EXPECT_EQ(silent.objectForKey("key"), std::nullopt);
}
