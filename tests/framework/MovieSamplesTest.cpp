// What the real media reader says of each sample movie, compared with what FFmpeg's own program says.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <set>
#include <thread>

#include "framework/metadata/FileTypes.h"
#include "framework/metadata/MetadataStore.h"
#include "tests/framework/FFprobe.h"
#include "tests/support/FileContent.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/Program.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

namespace vexo {
namespace {

namespace fs = std::filesystem;
using namespace testing_support;
using nlohmann::json;
using platform::Value;
using testing::HasSubstr;

const std::string samplesFolder = VEXO_SAMPLES_DIR "/movies";

std::string sample(const std::string& name) {
    return samplesFolder + "/" + name;
}

struct MovieSample {
    const char* name;
    const char* type;         // by its name
    const char* contentType;  // by its content, where that is another
};

void PrintTo(const MovieSample& movie, std::ostream* out) {
    *out << movie.name;
}

// Movies and sound that can be read. In a stream or a container the content does not tell of which kind of
// the same format the file is.
constexpr MovieSample readable[] = {
    {"clip.mov", "com.norvale.quicktime-movie", nullptr},
    {"clip.fcmov", "com.norvale.framecast-movie", "com.norvale.quicktime-movie"},
    {"clip.mp4", "public.mpeg-4", nullptr},
    {"clip.m4v", "com.norvale.m4v-video", "public.mpeg-4"},
    {"clip.3gp", "public.3gpp", nullptr},
    {"clip.3g2", "public.3gpp2", nullptr},
    {"clip.avi", "public.avi", nullptr},
    {"clip.mkv", "org.matroska.mkv", nullptr},
    {"clip.webm", "org.webmproject.webm", nullptr},
    {"clip.ogv", "org.xiph.ogg-video", nullptr},
    {"clip.flv", "com.adobe.flash.video", nullptr},
    {"clip.wmv", "com.microsoft.windows-media-wmv", "com.microsoft.advanced-systems-format"},
    {"clip.mpg", "public.mpeg", nullptr},
    {"clip.ts", "public.mpeg-2-transport-stream", nullptr},
    {"clip.mts", "public.avchd-mpeg-2-transport-stream", "public.mpeg-2-transport-stream"},
    {"clip.m2ts", "public.avchd-mpeg-2-transport-stream", "public.mpeg-2-transport-stream"},
    {"clip.mxf", "org.smpte.mxf", nullptr},
    {"recording", "com.norvale.quicktime-movie", nullptr},
    {"recording.xyz", "public.mpeg-4", nullptr},

    {"turned-90.mov", "com.norvale.quicktime-movie", nullptr},
    {"turned-180.mp4", "public.mpeg-4", nullptr},
    {"wide-pixels.mov", "com.norvale.quicktime-movie", nullptr},
    {"dated.mov", "com.norvale.quicktime-movie", nullptr},
    {"camera.mov", "com.norvale.quicktime-movie", nullptr},
    {"index-first.mov", "com.norvale.quicktime-movie", nullptr},
    {"fragmented.mp4", "public.mpeg-4", nullptr},
    {"two-pictures.mov", "com.norvale.quicktime-movie", nullptr},
    {"no-sound.mov", "com.norvale.quicktime-movie", nullptr},
    {"one-frame.mov", "com.norvale.quicktime-movie", nullptr},
    {"only-sound.mov", "com.norvale.quicktime-movie", nullptr},
    {"no-frames.mp4", "public.mpeg-4", nullptr},
    {"cut-in-content.mov", "com.norvale.quicktime-movie", nullptr},
    {"reference.mov", "com.norvale.quicktime-movie", nullptr},
    {"huge-picture.mov", "com.norvale.quicktime-movie", nullptr},

    {"tone.mp3", "public.mp3", nullptr},
    {"tone.m4a", "public.mpeg-4-audio", nullptr},
    {"cover.m4a", "public.mpeg-4-audio", nullptr},
    {"tone.wav", "com.microsoft.waveform-audio", nullptr},
    {"tone.flac", "org.xiph.flac", nullptr},
};

struct BrokenSample {
    const char* name;
    const char* problem;      // a part of it
    const char* contentType;  // by its content
};

void PrintTo(const BrokenSample& broken, std::ostream* out) {
    *out << broken.name;
}

constexpr BrokenSample broken[] = {
    {"only-words.mov", "neither picture nor sound", "com.norvale.quicktime-movie"},
    {"reference-index.mov", "neither picture nor sound", "com.norvale.quicktime-movie"},
    {"cut-before-index.mov", "no movie or sound", "com.norvale.quicktime-movie"},
    {"empty.mov", "", "public.data"},
    {"text.mov", "no movie or sound", "public.plain-text"},
    {"random.mov", "no movie or sound", "public.data"},
    {"huge-atom.mov", "no movie or sound", "com.norvale.quicktime-movie"},
    {"huge-frame-count.mov", "no movie or sound", "com.norvale.quicktime-movie"},
    {"many-tracks.mov", "", "com.norvale.quicktime-movie"},
};

bool isMovieType(const std::string& contentType) {
    return FileTypeTable::shared().typeNamed(contentType)->isMovie;
}

// --- What ffprobe says

// A cover picture is no video.
bool isVideo(const json& stream) {
    return stream.value("codec_type", "") == "video" && stream["disposition"].value("attached_pic", 0) == 0;
}

bool isSound(const json& stream) {
    return stream.value("codec_type", "") == "audio";
}

const json* firstOf(const json& probe, bool (*isWanted)(const json&)) {
    for (const json& stream : probe["streams"])
        if (isWanted(stream))
            return &stream;
    return nullptr;
}

json mediaTypesOf(const json& probe) {
    if (probe["format"]["format_name"] == "mpeg")
        return {"MPEG1 Muxed"};
    json types = json::array();
    if (firstOf(probe, isVideo))
        types.push_back("Video");
    if (firstOf(probe, isSound))
        types.push_back("Sound");
    return types;
}

json codecsOf(const json& probe) {
    json codecs = json::array();
    for (const json& stream : probe["streams"])
        if (isVideo(stream) || isSound(stream))
            if (std::find(codecs.begin(), codecs.end(), stream["codec_name"]) == codecs.end())
                codecs.push_back(stream["codec_name"]);
    return codecs;
}

bool isTurned(const json& video) {
    for (const json& data : video.value("side_data_list", json::array()))
        if (data.value("rotation", 0) % 180 != 0)
            return true;
    return false;
}

double quotient(const std::string& ratio) {
    const auto slash = ratio.find('/');
    return std::stod(ratio.substr(0, slash)) / std::stod(ratio.substr(slash + 1));
}

void addPicture(json& facts, const json& video) {
    if (video["width"] > 0) {
        facts[kMDItemPixelWidth] = video[isTurned(video) ? "height" : "width"];
        facts[kMDItemPixelHeight] = video[isTurned(video) ? "width" : "height"];
    }
    if (video["avg_frame_rate"] != "0/0")
        facts[kMDItemVideoFrameRate] = quotient(video["avg_frame_rate"]);
}

void addSound(json& facts, const json& sound) {
    facts[kMDItemAudioChannelCount] = sound["channels"];
    facts[kMDItemAudioSampleRate] = std::stoi(sound["sample_rate"].get<std::string>());
}

void addContainer(json& facts, const json& format) {
    if (format.contains("duration"))
        facts[kMDItemDurationSeconds] = std::stod(format["duration"].get<std::string>());
    if (format.contains("bit_rate"))
        facts[kMDItemTotalBitRate] = std::stoll(format["bit_rate"].get<std::string>());
    const json tags = format.value("tags", json::object());
    if (tags.contains("creation_time"))
        facts[kMDItemContentCreationDate] = tags["creation_time"].get<std::string>().substr(0, 19) + "Z";
    for (const auto& [key, tag] : {std::pair{kMDItemTitle, "title"},
                                   {kMDItemAcquisitionMake, "make"},
                                   {kMDItemAcquisitionModel, "model"}})
        if (tags.contains(tag))
            facts[key] = tags[tag];
}

json factsOf(const json& probe) {
    json facts{{kMDItemMediaTypes, mediaTypesOf(probe)}, {kMDItemCodecs, codecsOf(probe)}};
    addContainer(facts, probe["format"]);
    if (const json* video = firstOf(probe, isVideo))
        addPicture(facts, *video);
    if (const json* sound = firstOf(probe, isSound))
        addSound(facts, *sound);
    return facts;
}

// --- What the store says

json jsonOf(const Value& value) {
    if (value.string())
        return *value.string();
    if (value.integer())
        return *value.integer();
    if (value.real())
        return *value.real();
    if (value.date())
        return platform::iso8601String(*value.date());
    json elements = json::array();
    for (const Value& element : *value.array())
        elements.push_back(jsonOf(element));
    return elements;
}

json factsOf(const VXMetadataProperties& properties) {
    json facts = json::object();
    for (const std::string_view key :
         {kMDItemMediaTypes, kMDItemCodecs, kMDItemPixelWidth, kMDItemPixelHeight, kMDItemDurationSeconds,
          kMDItemContentCreationDate, kMDItemVideoFrameRate, kMDItemAudioChannelCount, kMDItemAudioSampleRate,
          kMDItemTotalBitRate, kMDItemTitle, kMDItemAcquisitionMake, kMDItemAcquisitionModel})
        if (const auto value = properties.valueForKey(key))
            facts[key] = jsonOf(*value);
    return facts;
}

class MovieSamples : public testing::Test {
  public:
    static void SetUpTestSuite() {
        sharedStore = std::make_unique<MetadataStore>(
            std::nullopt, std::make_shared<ProcessMediaReader>(
                              ProcessMediaReader::Settings{VEXO_BIN_DIR "/vexo-media-reader"}));
    }
    static void TearDownTestSuite() { sharedStore.reset(); }

  protected:
    json factsAbout(const std::string& path) const { return factsOf(*store_.propertiesForFile(path)); }

    void expectThatProbesAgree(const std::string& path) const {
        const auto probe = probed(path);
        if (!probe)
            GTEST_SKIP() << "ffprobe is not installed";
        EXPECT_EQ(factsAbout(path), factsOf(*probe)) << path;
    }

    std::string typeOf(const std::string& path) const {
        return *store_.propertiesForFile(path)->valueForKey(kMDItemContentType)->string();
    }

    // The sample under a name that does not tell its type.
    std::string withoutExtension(const char* name) const { return folder_.makeLink("untold", sample(name)); }

    const HostEnvironment environment_;
    const TemporaryFolder& folder_ = environment_.home;
    const MetadataStore& store_ = *sharedStore;

  private:
    // One for all the tests of a suite, so that the reader starts once; gone before other tests count
    // processes.
    inline static std::unique_ptr<MetadataStore> sharedStore;
};

class ReadableSample : public MovieSamples, public testing::WithParamInterface<MovieSample> {};
class UnreadableSample : public MovieSamples, public testing::WithParamInterface<BrokenSample> {};

template <typename Sample>
std::string testNameOf(const testing::TestParamInfo<Sample>& sampleInfo) {
    std::string name = sampleInfo.param.name;
    std::replace_if(
        name.begin(), name.end(), [](char c) { return c == '-' || c == '.'; }, '_');
    return name;
}

INSTANTIATE_TEST_SUITE_P(Each, ReadableSample, testing::ValuesIn(readable), testNameOf<MovieSample>);
INSTANTIATE_TEST_SUITE_P(Each, UnreadableSample, testing::ValuesIn(broken), testNameOf<BrokenSample>);

TEST_F(MovieSamples, EachIsClaimed) {
    std::set<std::string> claimed{"README.md", "make-movies"};
    for (const MovieSample& movie : readable)
        claimed.insert(movie.name);
    for (const BrokenSample& movie : broken)
        claimed.insert(movie.name);
    std::set<std::string> found;
    for (const auto& entry : fs::directory_iterator(samplesFolder))
        found.insert(entry.path().filename());
    EXPECT_EQ(found, claimed);
}

TEST_P(ReadableSample, SaysWhatFFprobeSays) {
    expectThatProbesAgree(sample(GetParam().name));
}

TEST_P(ReadableSample, HasItsTypeByNameOrByContent) {
    const MovieSample& movie = GetParam();
    EXPECT_EQ(typeOf(sample(movie.name)), movie.type);
    EXPECT_EQ(typeOf(withoutExtension(movie.name)), movie.contentType ? movie.contentType : movie.type);
}

TEST_P(ReadableSample, IsSupportedWhenItsTypeIsThatOfAMovie) {
    const MovieSample& movie = GetParam();
    EXPECT_EQ(store_.supportedMovieFile(sample(movie.name)), isMovieType(movie.type));
    EXPECT_EQ(store_.supportedMovieFile(withoutExtension(movie.name)), isMovieType(movie.type));
}

TEST_P(ReadableSample, HasAProblemWhenThereIsNoPictureInIt) {
    const std::string path = sample(GetParam().name);
    const bool isSoundAlone = factsAbout(path).at(kMDItemMediaTypes) == json{"Sound"};
    const std::optional<std::string> expected =
        isSoundAlone ? std::optional("sound without a picture, no movie") : std::nullopt;
    EXPECT_EQ(store_.problemWithFile(path), expected);
}

TEST_P(UnreadableSample, HasAProblemAndNoProperties) {
    const std::string path = sample(GetParam().name);
    EXPECT_EQ(factsAbout(path), json::object());
    const auto problem = store_.problemWithFile(path);
    ASSERT_TRUE(problem);
    EXPECT_THAT(*problem, HasSubstr(GetParam().problem));
    EXPECT_THAT(*problem, testing::Not(testing::IsEmpty()));
}

TEST_P(UnreadableSample, IsSupportedByItsTypeAllTheSame) {
    const std::string other = withoutExtension(GetParam().name);
    EXPECT_TRUE(store_.supportedMovieFile(sample(GetParam().name)));
    EXPECT_EQ(typeOf(other), GetParam().contentType);
    EXPECT_EQ(store_.supportedMovieFile(other), isMovieType(GetParam().contentType));
}

TEST_F(MovieSamples, ADVMovieIsOneByNameAndByContent) {
    const std::string path = folder_.path("clip.dv");
    makeSampleMovie(path, {.size = "720x576", .seconds = 0.2});
    expectThatProbesAgree(path);
    const std::string untold = folder_.makeLink("untold", path);
    EXPECT_EQ(typeOf(untold), "public.dv-movie");
    EXPECT_TRUE(store_.supportedMovieFile(untold));
}

// So that a sample which lost its oddity, and with it the test its meaning, is noticed.
TEST_F(MovieSamples, AreAsOddAsTheirNamesSay) {
    EXPECT_EQ(factsAbout(sample("turned-90.mov")).at(kMDItemPixelWidth), 24);
    EXPECT_EQ(factsAbout(sample("turned-180.mp4")).at(kMDItemPixelWidth), 32);
    EXPECT_EQ(factsAbout(sample("dated.mov")).at(kMDItemContentCreationDate), "2008-12-31T23:59:59Z");
    EXPECT_EQ(factsAbout(sample("cover.m4a")).at(kMDItemMediaTypes), json{"Sound"});
    EXPECT_FALSE(factsAbout(sample("no-frames.mp4")).contains(kMDItemDurationSeconds));
    EXPECT_FALSE(factsAbout(sample("reference.mov")).contains(kMDItemPixelWidth));
    const json camera = factsAbout(sample("camera.mov"));
    EXPECT_EQ(camera.at(kMDItemTitle), "Räder am Fluß");
    EXPECT_EQ(camera.at(kMDItemAcquisitionMake), "Camera Works");
    EXPECT_EQ(camera.at(kMDItemAcquisitionModel), "CW 100");
}

// --- Files that grow

TEST_F(MovieSamples, AMovieThatGrowsBetweenTwoQuestionsIsReadAgain) {
    for (const char* name : {"clip.mov", "clip.ts"}) {
        const std::string whole = contentOf(sample(name));
        const std::string path = folder_.writeFile(name, whole.substr(0, whole.size() / 2));
        EXPECT_NE(factsAbout(path), factsAbout(sample(name))) << name;
        folder_.writeFile(name, whole);
        EXPECT_EQ(factsAbout(path), factsAbout(sample(name))) << name;
    }
}

TEST_F(MovieSamples, AMovieThatGrowsWhileItIsReadEndsWithItsFinalProperties) {
    const std::string whole = contentOf(sample("clip.mpg"));
    const std::string path = folder_.writeFile("growing.mpg");
    std::atomic<bool> isWhole = false;
    std::thread camera([&] {
        std::ofstream file(path, std::ios::binary);
        for (std::size_t at = 0; at < whole.size(); at += 64)
            file << whole.substr(at, 64) << std::flush;
        isWhole = true;
    });
    while (!isWhole)
        factsAbout(path);
    camera.join();
    EXPECT_EQ(factsAbout(path), factsAbout(sample("clip.mpg")));
}

}  // namespace
}  // namespace vexo
