// vexo-soak: has many act on libraries and on hosts at once, and looks whether all is well in the end.
#include <CLI/CLI.hpp>
#include <clocale>
#include <filesystem>
#include <iostream>
#include <optional>
#include <random>

#include "tests/soak/Soak.h"
#include "tests/support/LoopImage.h"
#include "tests/support/OrdinaryUser.h"

namespace {

using namespace testing_support;

void keep(const TemporaryFolder& folder) {
    const std::string kept = folder.path() + "-kept";
    std::filesystem::rename(folder.path(), kept);
    std::cerr << "vexo-soak: what was there is in " << kept << "\n";
}

// Without mounts it runs as a user whom permissions hold back.
void soakIn(const TemporaryFolder& folder, const soak::Soak::Options& options) {
    std::optional<OrdinaryUser> user;
    if (!options.mounts)
        user.emplace(folder.path());
    const soak::Places places(folder);
    const ScopedEnvironment home("HOME", places.home.c_str());
    const ScopedEnvironment cache("XDG_CACHE_HOME", folder.makeFolder("cache").c_str());
    const ScopedEnvironment data("XDG_DATA_HOME", folder.makeFolder("data").c_str());
    soak::Soak(places, options).run();
}

}  // namespace

int main(int argc, char** argv) {
    std::setlocale(LC_ALL, "");
    soak::Soak::Options options;
    options.seed = std::random_device()();
    double seconds = options.time.count(), sessionSeconds = options.sessionTime.count();
    bool withoutMounts = false, keeps = false;
    CLI::App app(
        "Changes libraries, uses them in every way at once, and looks whether all is well in the end.");
    app.add_option("--seconds", seconds, "How long to begin sessions")->capture_default_str();
    app.add_option("--session-seconds", sessionSeconds, "How long to act in each")->capture_default_str();
    app.add_option("--seed", options.seed, "What the actors do by chance follows from it");
    app.add_flag("--without-mounts", withoutMounts, "Mount nothing, and run as an ordinary user");
    app.add_flag("--keep", keeps, "Keep the libraries when something is wrong");
    CLI11_PARSE(app, argc, argv);
    options.time = soak::Soak::Seconds(seconds);
    options.sessionTime = soak::Soak::Seconds(sessionSeconds);

    const auto reason = withoutMounts ? "that was asked for" : reasonAgainstMounting("ext4");
    options.mounts = !reason;
    std::cout << "seed " << options.seed << (reason ? "; no mounts: " + *reason : "; with mounts")
              << std::endl;
    const TemporaryFolder folder;
    try {
        soakIn(folder, options);
    } catch (const std::exception& error) {
        std::cerr << "vexo-soak: with --seed=" << options.seed << ": " << error.what() << "\n";
        if (keeps)
            keep(folder);
        return 1;
    }
    return 0;
}
