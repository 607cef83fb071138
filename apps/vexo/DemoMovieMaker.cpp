#include "apps/vexo/DemoMovieMaker.h"

#include <fmt/format.h>
#include <glib.h>
#include <unistd.h>

#include <filesystem>

namespace vexo {
namespace {

namespace fs = std::filesystem;

constexpr const char* programName = "vexo-sample-movie";

std::string helperProgram() {
    std::error_code unknown;
    const fs::path folder = fs::read_symlink("/proc/self/exe", unknown).parent_path();
    const fs::path beside = folder / programName;
    const fs::path installed = (folder / "../libexec/vexo" / programName).lexically_normal();
    const bool isInstalled = access(beside.c_str(), X_OK) != 0 && access(installed.c_str(), X_OK) == 0;
    return isInstalled ? installed : beside;
}

// What the helper said of itself, without its name before it.
std::string firstLine(std::string text) {
    const std::string name = std::string(programName) + ": ";
    if (text.starts_with(name))
        text.erase(0, name.size());
    return text.substr(0, text.find('\n'));
}

struct Run {
    bool started;
    bool succeeded;
    std::string message;  // what went wrong
};

Run run(std::vector<std::string> arguments) {
    std::vector<char*> pointers;
    for (std::string& argument : arguments)
        pointers.push_back(argument.data());
    pointers.push_back(nullptr);

    // Nothing is open that the helper must not have; told so, GLib takes posix_spawn.
    const auto flags = static_cast<GSpawnFlags>(G_SPAWN_LEAVE_DESCRIPTORS_OPEN | G_SPAWN_STDOUT_TO_DEV_NULL);
    g_autofree char* errorOutput = nullptr;
    g_autoptr(GError) error = nullptr;
    int status = 0;
    if (!g_spawn_sync(nullptr, pointers.data(), nullptr, flags, nullptr, nullptr, nullptr, &errorOutput,
                      &status, &error))
        return {false, false, {}};
    if (g_spawn_check_wait_status(status, &error))
        return {true, true, {}};
    const std::string said = firstLine(errorOutput);
    return {true, false, said.empty() ? error->message : said};
}

}  // namespace

DemoMovieMaker::DemoMovieMaker() : program_(helperProgram()) {}

std::optional<std::string> DemoMovieMaker::make(const std::string& path, const DemoMovie& movie,
                                                int tint) const {
    const Run helper =
        run({program_, "--size", movie.size, "--seconds", fmt::format("{}", movie.seconds), "--fps",
             fmt::format("{}", movie.framesPerSecond), "--tint", fmt::format("{}", tint), path});
    if (!helper.started)
        return fmt::format("the program that makes the movies cannot be run; build or install '{}'",
                           program_);
    if (!helper.succeeded)
        return fmt::format("no movie could be made: {}", helper.message);
    return std::nullopt;
}

}  // namespace vexo
