#include "tests/soak/Places.h"

#include <fcntl.h>
#include <unistd.h>

#include "platform/linux/FileDescriptor.h"
#include "tests/support/FileContent.h"

namespace soak {
namespace {

const std::vector<std::string> eventNames = {"Beach",   "Beach 2",   "Caf\xc3\xa9",    "Cafe\xcc\x81",
                                             "9 lives", "New\nline", "not \xff UTF-8", "Holiday"};
const std::vector<std::string> oddClipNames = {"no date.mov",
                                               "\xfe\xff.mov",
                                               "clip-2004-02-30 25;61;61.mov",
                                               "tab\there.mov",
                                               "clip-1899-12-31 23;59;59.mov",
                                               std::string(251, 'x') + ".mov"};

std::string ordinaryClipName(RandomSource& chance) {
    return "clip-200" + std::to_string(chance.below(9)) + "-05-0" + std::to_string(1 + chance.below(3)) +
           " 10;00;00." + (chance.oneIn(4) ? "mp4" : "mov");
}

// Waits for no reader where a pipe lies.
platform::FileDescriptor openToOverwrite(const std::string& path) {
    const int mode = O_WRONLY | O_CREAT | O_TRUNC | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
    return platform::FileDescriptor(open(path.c_str(), mode, 0644));
}

}  // namespace

Places::Places(const testing_support::TemporaryFolder& folder)
    : home(folder.makeFolder("home")),
      events(folder.makeFolder("home/Movies/Reelix Events")),
      projects(folder.makeFolder("home/Movies/Reelix Projects")),
      outside(folder.makeFolder("outside")),
      preferences(folder.makeFolder("home/.config/vexo") + "/com.vexo.suite.plist"),
      disk(folder.makeFolder("Disk")),
      diskImage(folder.path("disk.image")),
      coveredEvent(events + "/Covered"),
      coveredProject(projects + "/Covered") {}

std::string eventIn(const std::string& library, RandomSource& chance) {
    return library + "/" + chance.among(eventNames);
}

std::string clipIn(const std::string& event, RandomSource& chance) {
    return event + "/" + (chance.oneIn(6) ? chance.among(oddClipNames) : ordinaryClipName(chance));
}

std::string projectIn(const std::string& folder, RandomSource& chance) {
    static const std::vector<std::string> subfolders{"", "", "/Folder", "/Folder/Deeper"};
    return folder + chance.among(subfolders) + "/" + chance.among(eventNames) + ".qnproject";
}

std::string sampleMovie(RandomSource& chance) {
    static const std::vector<std::string> movies{"clip.mov",      "clip.mp4",          "camera.mov",
                                                 "one-frame.mov", "text.mov",          "random.mov",
                                                 "empty.mov",     "cut-in-content.mov"};
    return VEXO_SAMPLES_DIR "/movies/" + chance.among(movies);
}

std::string sampleDocument(RandomSource& chance) {
    static const std::vector<std::string> documents{"with-trailer.plist",     "without-trailer.plist",
                                                    "with-trailer-xml.plist", "cyclic.plist",
                                                    "truncated.plist",        "root-is-text.plist"};
    return VEXO_SAMPLES_DIR "/archives/" + chance.among(documents);
}

bool overwrite(const std::string& path, const std::string& content) {
    const auto file = openToOverwrite(path);
    return file && write(file.number(), content.data(), content.size()) == ssize_t(content.size());
}

bool copyOver(const std::string& source, const std::string& path) {
    return overwrite(path, testing_support::contentOf(source));
}

}  // namespace soak
