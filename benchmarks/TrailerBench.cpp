// "Is it a trailer?" for documents of a few kilobytes up to tens of megabytes, beside a reader of the same
// documents that trusts every byte, and beside the packaged library for property lists.
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <plist/plist.h>

#include <algorithm>
#include <chrono>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>

#include "benchmarks/BareDocument.h"
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

struct Release {
    void operator()(void* list) const { plist_free(list); }
};

// Where a reference of the archive leads to; nil for none.
plist_t archived(plist_t objects, plist_t reference) {
    std::uint64_t number = 0;
    if (!reference || plist_get_node_type(reference) != PLIST_UID)
        return nullptr;
    plist_get_uid_val(reference, &number);
    return plist_array_get_item(objects, static_cast<std::uint32_t>(number));
}

// The value under `key` of a dictionary that is archived as two lists.
plist_t archivedValueOf(plist_t objects, plist_t dictionary, const char* key) {
    plist_t keys = dictionary ? plist_dict_get_item(dictionary, "NS.keys") : nullptr;
    for (std::uint32_t i = 0; keys && i < plist_array_get_size(keys); ++i) {
        const char* text = plist_get_string_ptr(archived(objects, plist_array_get_item(keys, i)), nullptr);
        if (std::string_view(text ? text : "") == key)
            return archived(objects, plist_array_get_item(plist_dict_get_item(dictionary, "NS.objects"), i));
    }
    return nullptr;
}

// With the packaged library, which reads a document whole.
bool isTrailerByLibrary(const std::string& document) {
    std::string bytes(std::filesystem::file_size(document), '\0');
    std::ifstream(document, std::ios::binary).read(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    plist_t list = nullptr;
    plist_from_memory(bytes.data(), static_cast<std::uint32_t>(bytes.size()), &list);
    const std::unique_ptr<void, Release> owned(list);
    plist_t objects = plist_dict_get_item(list, "$objects");
    plist_t root = archived(objects, plist_access_path(list, 2, "$top", "root"));
    return archivedValueOf(objects, archivedValueOf(objects, root, "editInfo"), "trailer") != nullptr;
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
            askAgain(library, 1, [&] { return isTrailerByLibrary(document); });
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
