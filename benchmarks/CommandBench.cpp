// The command line from process start to exit, as a script that calls it feels it.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <spawn.h>
#include <sys/wait.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <span>
#include <stdexcept>
#include <string>
#include <vector>

#include "benchmarks/SampleLibrary.h"
#include "benchmarks/Surroundings.h"

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;

constexpr int projects = 2'000;
constexpr int moviesAProject = 5;

struct Run {
    double seconds;
    std::string output;
};

std::string textOf(const std::string& path) {
    std::ifstream stream(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(stream), {}};
}

std::vector<std::byte> contentOf(const std::string& path) {
    const std::string text = textOf(path);
    const auto bytes = std::as_bytes(std::span(text));
    return {bytes.begin(), bytes.end()};
}

// Runs a program in `folder`, into which its output and its errors go.
Run run(std::vector<std::string> words, const std::string& folder) {
    const std::string output = folder + "/output";
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 1, output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    posix_spawn_file_actions_adddup2(&actions, 1, 2);
    std::string cache = "XDG_CACHE_HOME=" + folder + "/cache";
    std::vector<char*> environment{cache.data(), nullptr};
    std::vector<char*> arguments;
    for (std::string& word : words)
        arguments.push_back(word.data());
    arguments.push_back(nullptr);

    pid_t child = 0;
    int status = -1;
    const auto start = Clock::now();
    const int error =
        posix_spawn(&child, arguments[0], &actions, nullptr, arguments.data(), environment.data());
    if (error == 0)
        waitpid(child, &status, 0);
    const std::chrono::duration<double> time = Clock::now() - start;
    posix_spawn_file_actions_destroy(&actions);
    if (status != 0)
        throw std::runtime_error(words[0] + " failed");
    return {time.count(), textOf(output)};
}

void keepFaster(Run& fastest, Run next) {
    if (next.seconds < fastest.seconds)
        fastest = std::move(next);
}

// Of several runs of each program the one that was disturbed least. They take turns, so that what else the
// machine does disturbs both alike.
struct FastestRuns {
    Run floor;
    Run tree;
};

FastestRuns fastestRuns(const std::vector<std::string>& floor, const std::vector<std::string>& tree,
                        const std::string& folder, int times) {
    FastestRuns fastest{run(floor, folder), run(tree, folder)};
    for (int i = 1; i < times; ++i) {
        keepFaster(fastest.floor, run(floor, folder));
        keepFaster(fastest.tree, run(tree, folder));
    }
    return fastest;
}

std::vector<std::string> treeOf(const std::string& home) {
    return {VEXO_BENCH_PROGRAM, "--plugin", REELIX_BUNDLE_DIR, "--home", home, "tree"};
}

void emptyHome(benchmark::State& state) {
    const bench::Folder folder;
    const std::string home = folder.path() + "/home";
    fs::create_directory(home);
    for ([[maybe_unused]] auto iteration : state) {
        const auto [floor, tree] = fastestRuns({"/bin/true"}, treeOf(home), folder.path(), 40);
        if (tree.output.find("Reelix") == std::string::npos)
            state.SkipWithError("there is no tree");
        state.SetIterationTime(tree.seconds);
        state.counters["floor_ms"] = floor.seconds * 1e3;
        state.counters["over_floor_ms"] = (tree.seconds - floor.seconds) * 1e3;
    }
}
BENCHMARK(emptyHome)->Name("Start/EmptyHome")->UseManualTime()->Iterations(1)->Unit(benchmark::kMillisecond);

// Projects of several movies, each with that content.
void makeProjects(const std::string& home, const std::vector<std::byte>& content) {
    bench::makeLibraries(home, {.projects = projects});
    for (const auto& entry : fs::recursive_directory_iterator(bench::projectsFolder(home))) {
        if (entry.path().extension() != ".qnproject")
            continue;
        const std::string movies = entry.path().string() + "/Movies";
        fs::create_directory(movies);
        for (int i = 0; i < moviesAProject; ++i)
            bench::writeFile(fmt::format("{}/Movie {}.mov", movies, i), content);
    }
}

// Nothing is known of a movie without content, so the same tree of such movies asks for nothing.
void secondTree(benchmark::State& state) {
    const bench::Folder folder;
    const std::string home = folder.path() + "/home", bareHome = folder.path() + "/bare";
    makeProjects(home, contentOf(VEXO_BENCH_MOVIE));
    makeProjects(bareHome, {});
    const Run first = run(treeOf(home), folder.path());
    for ([[maybe_unused]] auto iteration : state) {
        const auto [floor, second] = fastestRuns(treeOf(bareHome), treeOf(home), folder.path(), 15);
        if (second.output != first.output || second.output == floor.output)
            state.SkipWithError("the second tree is another one");
        state.SetIterationTime(second.seconds);
        state.counters["to_floor"] = second.seconds / floor.seconds;
        state.counters["first_to_floor"] = first.seconds / floor.seconds;
    }
}
BENCHMARK(secondTree)
    ->Name("Start/SecondTree")
    ->UseManualTime()
    ->Iterations(1)
    ->Unit(benchmark::kMillisecond);

}  // namespace
