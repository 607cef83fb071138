#include "apps/vexo/DemoDocument.h"

#include "apps/vexo/DemoArchive.h"

namespace vexo {
namespace {

using Reference = DemoArchive::Reference;

std::string lastComponent(const std::string& path) {
    return path.substr(path.rfind('/') + 1);
}

class Document {
  public:
    explicit Document(const DemoProject& project) : project_(project) {}

    platform::Value archive();

  private:
    Reference addTimeline();
    Reference addClip(int number, Reference timeline);
    Reference addTitle(const std::string& text, Reference clip, Reference style);
    Reference addEditInfo();
    Reference addTrailer();

    const DemoProject& project_;
    DemoArchive archive_;
    std::vector<Reference> clips_;
};

platform::Value Document::archive() {
    const Reference root = archive_.reserve();
    const Reference timeline = addTimeline();
    archive_.set(root, archive_.dictionary({{"name", archive_.add(lastComponent(project_.name))},
                                            {"version", archive_.add(7)},
                                            {"created", archive_.addDate(/*in May 2008*/ 232630812.25)},
                                            {"timeline", timeline},
                                            {"editInfo", addEditInfo()}}));
    return archive_.propertyList(root);
}

Reference Document::addTimeline() {
    const Reference timeline = archive_.reserve();
    for (int number = 1; number <= 3; ++number)
        clips_.push_back(addClip(number, timeline));
    const Reference style = archive_.addObject(
        "QNTitleStyle", {{"font", DemoArchive::reference(archive_.add("Futura"))}, {"size", 36.0}});
    const Reference titles = archive_.addArray({addTitle(lastComponent(project_.name), clips_.front(), style),
                                                addTitle("The End", clips_.back(), style)});
    archive_.set(timeline, archive_.object("QNTimeline",
                                           {{"clips", DemoArchive::reference(archive_.addArray(clips_))},
                                            {"titles", DemoArchive::reference(titles)},
                                            {"soundtrack", DemoArchive::reference(DemoArchive::nothing)}}));
    return timeline;
}

// Clips know the timeline that they are on: references of an archive may form a circle.
Reference Document::addClip(int number, Reference timeline) {
    const Reference event = archive_.add("Beach Holiday");
    return archive_.addObject("QNClip", {{"event", DemoArchive::reference(event)},
                                         {"number", number},
                                         {"inPoint", 0.5 * number},
                                         {"outPoint", 2.0 * number},
                                         {"muted", number == 2},
                                         {"timeline", DemoArchive::reference(timeline)}});
}

Reference Document::addTitle(const std::string& text, Reference clip, Reference style) {
    return archive_.addObject("QNTitle", {{"text", DemoArchive::reference(archive_.add(text))},
                                          {"clip", DemoArchive::reference(clip)},
                                          {"style", DemoArchive::reference(style)}});
}

Reference Document::addEditInfo() {
    DemoArchive::Entries entries{{"aspectRatio", archive_.add("16:9")},
                                 {"framesPerSecond", archive_.add(29.97)},
                                 {"theme", archive_.add("Postcard")},
                                 {"playhead", clips_.front()}};
    if (project_.kind == DemoProjectKind::trailer)
        entries.emplace_back("trailer", addTrailer());
    return archive_.addDictionary(entries);
}

Reference Document::addTrailer() {
    const Reference storyboard = archive_.addObject(
        "QNStoryboard", {{"shots", DemoArchive::reference(archive_.addArray(clips_))}, {"complete", true}});
    return archive_.addDictionary({{"genre", archive_.add("Adventure")}, {"storyboard", storyboard}});
}

}  // namespace

std::vector<std::byte> demoDocument(const DemoProject& project) {
    return platform::dataWithPropertyList(Document(project).archive(), project.format);
}

}  // namespace vexo
