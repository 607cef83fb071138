// A library as somebody careless or malicious may leave it, and what a whole host with the real plug-in makes
// of it. Every load is judged as well: whatever lies in the library, the outputs are fit to be read by people
// and by programs.
#pragma once

#include <gmock/gmock.h>

#include <functional>
#include <string>
#include <vector>

#include "framework/Host.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {

// What one load found. Paths are those below the folder of the library, sorted, of the bytes that the disk
// has; "home" stands for the home in warnings.
struct FoundLibrary {
    std::vector<std::string> projects;
    std::vector<std::string> movies;  // of projects
    std::vector<std::string> clips;   // of events
    std::vector<std::string> warnings;

    // How many warnings name the path, which has no part in common with others.
    long warningsNaming(const std::string& path) const;
};

class HostileLibraryTest : public testing::Test {
  protected:
    HostileLibraryTest();

    // Loads the library, and judges the tree as `vexo tree` prints it.
    FoundLibrary load();
    // Loads it and prints nothing: the text of a deep tree is as wide as that is deep.
    FoundLibrary loadUnprinted();

    // A host that is ready to load.
    void withHost(const std::function<void(vexo::Host& host)>& use);

    // Below the folder of project libraries, a package with one movie.
    void makeProject(const std::string& name) const;
    // Below the folder of event libraries, a clip.
    void makeClip(const std::string& name) const;
    std::string project(const std::string& name) const { return projects_ + "/" + name; }
    std::string event(const std::string& name) const { return events_ + "/" + name; }

    TemporaryFolder home_;
    vexo::HostOptions options_{.homeDirectory = home_.path(), .pluginBundles = {REELIX_BUNDLE_DIR}};

  private:
    FoundLibrary found(vexo::Host& host) const;

    const std::string projects_ = "Movies/Reelix Projects";
    const std::string events_ = "Movies/Reelix Events";
    const ScopedEnvironment cache_{"XDG_CACHE_HOME", home_.makeFolder("cache").c_str()};
    const ScopedEnvironment reader_{"VEXO_MEDIA_READER", VEXO_BIN_DIR "/vexo-media-reader"};
};

}  // namespace testing_support
