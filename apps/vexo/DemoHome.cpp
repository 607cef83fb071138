#include "apps/vexo/DemoHome.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <sys/xattr.h>

#include <cerrno>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <span>

#include "apps/vexo/DemoDocument.h"
#include "apps/vexo/DemoStaging.h"
#include "apps/vexo/Interruption.h"

namespace vexo {
namespace {

namespace fs = std::filesystem;

constexpr const char* projectLibrary = "Movies/Reelix Projects";
constexpr const char* eventLibrary = "Movies/Reelix Events";

// Writes a home's files. The first failure stays, and nothing is done after it.
class HomeWriter {
  public:
    HomeWriter(std::string folder, const DemoMovieMaker& movies)
        : folder_(std::move(folder)), movies_(movies) {}

    void write(const DemoContents& contents);

    const std::optional<std::string>& problem() const { return problem_; }
    const DemoHome& written() const { return written_; }

  private:
    void addProject(const DemoProject& project);
    void addEvent(const DemoEvent& event);
    void addWhatIsNoEvent(const DemoMovie& movie);

    std::string makeFolder(const std::string& relative);
    void writeFile(const std::string& path, std::span<const std::byte> bytes);
    void addMovie(const std::string& path, const DemoMovie& movie);
    void setDateAttribute(const std::string& path, const std::string& date);
    void setModificationTime(const std::string& path, const std::string& date);

    void failAt(const std::string& path, int error);

    const std::string folder_;
    const DemoMovieMaker& movies_;
    int tint_ = 0;  // one for each folder of movies
    std::optional<std::string> problem_;
    DemoHome written_;
};

void HomeWriter::write(const DemoContents& contents) {
    for (const DemoProject& project : contents.projects)
        addProject(project);
    for (const DemoEvent& event : contents.events)
        addEvent(event);
    addWhatIsNoEvent(contents.events.front().clips.front().movie);
}

void HomeWriter::addProject(const DemoProject& project) {
    const std::string package = makeFolder(fmt::format("{}/{}.qnproject", projectLibrary, project.name));
    writeFile(package + "/Project", demoDocument(project));
    ++tint_;
    if (!project.renders.empty())
        makeFolder(fmt::format("{}/{}.qnproject/Movies", projectLibrary, project.name));
    for (const DemoMovie& movie : project.renders)
        addMovie(package + "/Movies/" + movie.name, movie);
    setModificationTime(package, project.changed);
    ++written_.projects;
    written_.trailers += project.kind == DemoProjectKind::trailer;
}

void HomeWriter::addEvent(const DemoEvent& event) {
    const std::string folder = makeFolder(fmt::format("{}/{}", eventLibrary, event.name));
    ++tint_;
    for (const DemoClip& clip : event.clips) {
        addMovie(folder + "/" + clip.movie.name, clip.movie);
        if (!clip.recorded.empty())
            setDateAttribute(folder + "/" + clip.movie.name, clip.recorded);
    }
    ++written_.events;
}

// Folders that lie among the events and are none: one without clips and one that is hidden.
void HomeWriter::addWhatIsNoEvent(const DemoMovie& movie) {
    const std::string notes = makeFolder(fmt::format("{}/Shot Lists", eventLibrary));
    constexpr std::string_view text = "Sunrise over the ridge\nThe dog and the frisbee\n";
    writeFile(notes + "/Next summer.txt", std::as_bytes(std::span(text)));
    addMovie(makeFolder(fmt::format("{}/.Import", eventLibrary)) + "/" + movie.name, movie);
}

// Answers the absolute path.
std::string HomeWriter::makeFolder(const std::string& relative) {
    const std::string path = folder_ + "/" + relative;
    std::error_code error;
    if (!problem_ && !fs::create_directories(path, error) && error)
        failAt(path, error.value());
    return path;
}

void HomeWriter::writeFile(const std::string& path, std::span<const std::byte> bytes) {
    if (problem_)
        return;
    errno = 0;
    std::ofstream file(path, std::ios::binary);
    file.write(reinterpret_cast<const char*>(bytes.data()), static_cast<std::streamsize>(bytes.size()));
    file.close();
    if (!file)
        return failAt(path, errno);
    written_.bytes += bytes.size();
}

void HomeWriter::addMovie(const std::string& path, const DemoMovie& movie) {
    if (problem_)
        return;
    problem_ = movies_.make(path, movie, tint_);
    // A terminal interrupts the helper as well, so its failure may be no news.
    if (Interruption::requested())
        problem_ = "interrupted; nothing was made";
    if (problem_)
        return;
    std::error_code error;
    written_.bytes += fs::file_size(path, error);
    if (error)
        return failAt(path, error.value());
    ++written_.movies;
}

void HomeWriter::setDateAttribute(const std::string& path, const std::string& date) {
    if (problem_ || setxattr(path.c_str(), "user.date", date.data(), date.size(), 0) == 0)
        return;
    if (errno != ENOTSUP)
        return failAt(path, errno);
    written_.keepsAttributes = false;
}

void HomeWriter::setModificationTime(const std::string& path, const std::string& date) {
    std::tm local{};
    strptime(date.c_str(), "%Y-%m-%d %H;%M;%S", &local);
    local.tm_isdst = -1;  // summer time as it was on that day
    const timespec time{std::mktime(&local), 0};
    const timespec times[2] = {time, time};
    if (!problem_ && utimensat(AT_FDCWD, path.c_str(), times, 0) != 0)
        failAt(path, errno);
}

void HomeWriter::failAt(const std::string& path, int error) {
    problem_ = fmt::format("cannot write '{}': {}", fs::path(path).lexically_relative(folder_).string(),
                           std::strerror(error));
}

}  // namespace

DemoHomeResult makeDemoHome(const std::string& folder, const DemoMovieMaker& movies) {
    const Interruption interruption;
    const DemoStaging staging(folder);
    if (staging.problem())
        return {std::nullopt, *staging.problem()};
    HomeWriter writer(staging.path(), movies);
    writer.write(demoContents());
    if (writer.problem())
        return {std::nullopt, *writer.problem()};
    if (const std::optional<std::string> problem = staging.publish())
        return {std::nullopt, *problem};

    DemoHome home = writer.written();
    std::error_code unknown;
    home.folder = fs::canonical(folder, unknown);
    return {home, {}};
}

}  // namespace vexo
