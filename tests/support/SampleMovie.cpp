#include "tests/support/SampleMovie.h"

#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <stdexcept>
#include <vector>

namespace testing_support {

namespace {

std::vector<std::string> argumentsFor(const std::string& path, const SampleMovie& movie) {
    std::vector<std::string> arguments{VEXO_BIN_DIR "/vexo-sample-movie", "--size=" + movie.size,
                                       "--seconds=" + std::to_string(movie.seconds),
                                       "--rotate=" + std::to_string(movie.rotation),
                                       "--tint=" + std::to_string(movie.tint)};
    if (!movie.format.empty())
        arguments.push_back("--format=" + movie.format);
    if (!movie.creationTime.empty())
        arguments.push_back("--creation-time=" + movie.creationTime);
    if (!movie.hasVideo)
        arguments.push_back("--no-video");
    if (!movie.hasSound)
        arguments.push_back("--no-sound");
    arguments.insert(arguments.end(), {"--", path});
    return arguments;
}

}  // namespace

void makeSampleMovie(const std::string& path, const SampleMovie& movie) {
    std::vector<std::string> arguments = argumentsFor(path, movie);
    std::vector<char*> pointers;
    for (std::string& argument : arguments)
        pointers.push_back(argument.data());
    pointers.push_back(nullptr);
    pid_t process;
    int status = 0;
    if (posix_spawn(&process, pointers[0], nullptr, nullptr, pointers.data(), environ) != 0 ||
        waitpid(process, &status, 0) != process || status != 0)
        throw std::runtime_error("cannot make the movie " + path);
}

}  // namespace testing_support
