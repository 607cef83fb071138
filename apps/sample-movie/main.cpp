// vexo-sample-movie: makes a small real movie.
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>
#include <CLI/CLI.hpp>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <stdexcept>
#include <string>
#include <system_error>

#include "apps/sample-movie/MovieWriter.h"

extern "C" {
#include <libavutil/log.h>
#include <libavutil/parseutils.h>
}

namespace {

using sample::Movie;
using sample::MovieFormat;

constexpr int smallestSide = 16;
constexpr int largestSide = 8192;
constexpr double longestMovie = 600;
constexpr double mostPixels =
    4e10;  // of all frames together; keeps a slip of the keyboard from running for hours

// The command line is understood and asks for something that cannot be.
struct WrongUse : std::runtime_error {
    using std::runtime_error::runtime_error;
};

struct Arguments {
    std::string output;
    std::string format;
    std::string size;
    std::string creationTime;
    double seconds = 2;
    int framesPerSecond = 0;
    int rotation = 0;
    int tint = 0;
    bool noVideo = false;
    bool noSound = false;
};

void declare(CLI::App& app, Arguments& arguments) {
    app.add_option("OUT", arguments.output, "The file to write")->required();
    app.add_option("--format", arguments.format,
                   "mov, mp4, m4v, 3gp, mkv, webm, avi, mpg or dv; else by OUT's ending");
    app.add_option("--size", arguments.size, "The picture's WIDTHxHEIGHT in pixels");
    app.add_option("--seconds", arguments.seconds, "How long it plays")->check(CLI::Range(0.1, longestMovie));
    app.add_option("--fps", arguments.framesPerSecond, "Frames a second")->check(CLI::Range(1, 120));
    app.add_option("--creation-time", arguments.creationTime,
                   "When it was recorded, as 2008-12-31T23:59:59Z");
    app.add_option("--rotate", arguments.rotation, "Degrees by which players turn the picture clockwise")
        ->check(CLI::IsMember({0, 90, 180, 270}));
    app.add_option("--tint", arguments.tint, "A number that chooses the colour")
        ->check(CLI::Range(0, 1000000));
    app.add_flag("--no-video", arguments.noVideo, "Sound alone");
    app.add_flag("--no-sound", arguments.noSound, "Picture alone");
}

const MovieFormat& formatFor(const Arguments& arguments) {
    std::string name = arguments.format;
    if (name.empty())
        name = arguments.output.substr(arguments.output.rfind('.') + 1);
    const MovieFormat* format = sample::movieFormat(name);
    if (!format)
        throw WrongUse(fmt::format("no such format: {} (choose one with --format)", name));
    return *format;
}

void setSize(Movie& movie, const std::string& size) {
    char rest = 0;
    if (std::sscanf(size.c_str(), "%5dx%5d%c", &movie.width, &movie.height, &rest) != 2)
        throw WrongUse(fmt::format("--size is WIDTHxHEIGHT, not {}", size));
    for (const int side : {movie.width, movie.height})
        if (side < smallestSide || side > largestSide)
            throw WrongUse(fmt::format("--size takes sides from {} to {}", smallestSide, largestSide));
}

void requireThatFormatAllows(const Movie& movie) {
    const MovieFormat& format = *movie.format;
    if (!format.anySize && (movie.width != format.width || movie.height != format.height))
        throw WrongUse(
            fmt::format("{} has the size {}x{} alone", format.extension, format.width, format.height));
    if (!format.anyFrameRate && movie.framesPerSecond != format.framesPerSecond)
        throw WrongUse(fmt::format("{} is made with {} frames a second alone", format.extension,
                                   format.framesPerSecond));
    if (movie.creationTime && !format.keepsCreationTime)
        throw WrongUse(fmt::format("{} keeps no creation time", format.extension));
    if (movie.clockwiseRotation != 0 && !(format.keepsRotation && movie.hasVideo))
        throw WrongUse(fmt::format("this {} cannot be turned", format.extension));
    if (!movie.hasVideo && !movie.hasSound)
        throw WrongUse(fmt::format("nothing is left to put into the {}", format.extension));
    if (movie.seconds * movie.framesPerSecond * movie.width * movie.height > mostPixels)
        throw WrongUse("that would be no small movie");
}

Movie movieFor(const Arguments& arguments) {
    Movie movie;
    movie.format = &formatFor(arguments);
    movie.width = movie.format->width;
    movie.height = movie.format->height;
    if (!arguments.size.empty())
        setSize(movie, arguments.size);
    movie.seconds = arguments.seconds;
    movie.framesPerSecond =
        arguments.framesPerSecond ? arguments.framesPerSecond : movie.format->framesPerSecond;
    movie.hasVideo = !arguments.noVideo;
    movie.hasSound = !arguments.noSound && movie.format->soundCodec != AV_CODEC_ID_NONE;
    movie.clockwiseRotation = arguments.rotation;
    movie.tint = arguments.tint;
    if (std::int64_t time = 0; !arguments.creationTime.empty()) {
        if (av_parse_time(&time, arguments.creationTime.c_str(), /*duration=*/0) < 0)
            throw WrongUse(
                fmt::format("--creation-time is as 2008-12-31T23:59:59Z, not {}", arguments.creationTime));
        movie.creationTime = arguments.creationTime;
    }
    requireThatFormatAllows(movie);
    return movie;
}

[[noreturn]] void failToWrite(const std::string& path, int error) {
    throw std::runtime_error(fmt::format("cannot write {}: {}", path, std::strerror(error)));
}

// The file appears under its name when it is complete: whoever watches the folder never sees half a movie.
void writeAtOnce(const std::string& path, const std::vector<std::byte>& bytes) {
    std::string temporary = path + ".XXXXXX";
    const int descriptor = mkstemp(temporary.data());
    if (descriptor < 0)
        failToWrite(path, errno);
    std::FILE* file = fdopen(descriptor, "wb");
    const mode_t mask = umask(0);
    umask(mask);
    const bool written = std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size() &&
                         fchmod(descriptor, 0666 & ~mask) == 0;
    const bool closed = std::fclose(file) == 0;
    if (written && closed && std::rename(temporary.c_str(), path.c_str()) == 0)
        return;
    const int error = errno;
    unlink(temporary.c_str());
    failToWrite(path, error);
}

int fail(const std::exception& error, int status) {
    std::string line = error.what();
    line = line.substr(0, line.find('\n'));
    fmt::print(stderr, "vexo-sample-movie: {}\n", line);
    return status;
}

}  // namespace

int main(int argc, char** argv) {
    CLI::App app("Makes a small real movie: a coloured card that a disc crosses, with a quiet tone.",
                 "vexo-sample-movie");
    Arguments arguments;
    declare(app, arguments);
    av_log_set_level(AV_LOG_QUIET);
    try {
        app.parse(argc, argv);
        const Movie movie = movieFor(arguments);
        writeAtOnce(arguments.output, sample::encodedMovie(movie));
        return 0;
    } catch (const CLI::Success& help) {
        return app.exit(help);
    } catch (const CLI::Error& error) {
        return fail(error, 2);
    } catch (const WrongUse& error) {
        return fail(error, 2);
    } catch (const std::exception& error) {
        return fail(error, 1);
    }
}
