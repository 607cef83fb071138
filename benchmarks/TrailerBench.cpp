// "Is it a trailer?" for documents of a few kilobytes up to tens of megabytes, beside a reader of the same
// documents that trusts every byte, and beside the packaged library for property lists.
#include <benchmark/benchmark.h>
#include <fcntl.h>

#include <algorithm>
#include <chrono>
#include <string>

#include "benchmarks/BareDocument.h"
#include "benchmarks/LibplistDocument.h"
#include "benchmarks/SampleLibrary.h"
#include "benchmarks/Surroundings.h"
#include "platform/FileManager.h"
#include "platform/KeyedUnarchiver.h"
#include "platform/Services.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr int rounds = 20;
constexpr int answersARound = 50;
constexpr int libraryAnswers = 3;

// As the plug-in asks.
bool isTrailer(const std::string& document) {
    platform::KeyedUnarchiver unarchiver(platform::services().fileManager.openFileAtPath(document), nullptr);
    const auto root = unarchiver.decodeObjectForKey("root");
    const auto editInfo = root ? root->objectForKey("editInfo") : nullptr;
    return editInfo && editInfo->objectForKey("trailer");
}

// Seconds for one answer, and how many of them were yes.
struct Answers {
    double seconds = 1e9;
    int yes = 0;
};

template <typename Ask>
void askAgain(Answers& answers, int times, const Ask& ask) {
    const auto start = Clock::now();
    for (int i = 0; i < times; ++i)
        answers.yes += ask();
    const std::chrono::duration<double> time = Clock::now() - start;
    answers.seconds = std::min(answers.seconds, time.count() / times);
}

void IsItATrailer(benchmark::State& state) {
    const bench::Folder folder;
    const bench::Services services;
    const std::string document = folder.path() + "/Project";
    bench::writeFile(document, bench::sampleDocument(static_cast<std::size_t>(state.range(0)) * 1024,
                                                     /*isTrailer=*/true));
    for (auto _ : state) {
        Answers floor, ours, library;
        for (int i = 0; i < rounds; ++i) {
            askAgain(floor, answersARound,
                     [&] { return bench::isTrailerBarely(AT_FDCWD, document.c_str()); });
            askAgain(ours, answersARound, [&] { return isTrailer(document); });
        }
        // It takes seconds for the largest.
        for (int i = 0; i < libraryAnswers; ++i)
            askAgain(library, 1, [&] { return bench::isTrailerByLibplist(document); });
        if (floor.yes != rounds * answersARound || ours.yes != floor.yes || library.yes != libraryAnswers)
            state.SkipWithError("a trailer was not known as one");
        state.SetIterationTime(ours.seconds);
        state.counters["to_floor"] = ours.seconds / floor.seconds;
        state.counters["to_libplist"] = ours.seconds / library.seconds;
        state.counters["floor_us"] = floor.seconds * 1e6;
    }
}
BENCHMARK(IsItATrailer)
    ->ArgName("KiB")
    ->Arg(3)
    ->Arg(100)
    ->Arg(1000)
    ->Arg(10'000)
    ->Arg(50'000)
    ->Iterations(1)
    ->UseManualTime()
    ->Unit(benchmark::kMicrosecond);

}  // namespace
