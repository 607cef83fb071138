#include "apps/vexo/TextTree.h"

#include <fmt/chrono.h>
#include <fmt/format.h>

#include <cmath>

#include "apps/vexo/Json.h"

namespace vexo {
namespace {

constexpr std::size_t gap = 2;            // blanks between columns
constexpr std::size_t shortestName = 16;  // names are not cut below this, whatever the terminal's width
constexpr std::size_t widestColumn = 56;  // for names where no terminal sets a width; longer ones stick out
constexpr const char* nameless = "(no name)";

bool isProject(const VXMediaGroup& group) {
    return group.typeIdentifier() == VXReelixProjectGroupTypeIdentifier;
}

// A host sees by the icon alone whether a project is a trailer.
bool isTrailer(const VXMediaGroup& group) {
    const platform::ImageRef icon = group.icon();
    return icon && icon->name() == "Reelix-icon-trailer";
}

std::string counted(std::size_t count, const char* noun) {
    return fmt::format("{} {}{}", count, noun, count == 1 ? "" : "s");
}

// What lies below a group, counted by kind.
struct Contents {
    std::size_t projects = 0;
    std::size_t events = 0;
    std::size_t clips = 0;

    void add(const VXMediaGroup& group) {
        const auto& type = group.typeIdentifier();
        if (type == VXReelixProjectGroupTypeIdentifier)
            ++projects;
        if (type == VXReelixEventGroupTypeIdentifier) {
            ++events;
            clips += group.mediaObjectCount();
        }
        for (const VXMediaGroupRef& child : group.childGroups())
            add(*child);
    }

    std::string text() const {
        std::vector<std::string> parts;
        if (projects > 0)
            parts.push_back(counted(projects, "project"));
        if (events > 0)
            parts.push_back(counted(events, "event"));
        if (clips > 0)
            parts.push_back(counted(clips, "clip"));
        return fmt::format("{}", fmt::join(parts, ", "));
    }
};

Contents contentsBelow(const VXMediaGroup& group) {
    Contents contents;
    for (const VXMediaGroupRef& child : group.childGroups())
        contents.add(*child);
    return contents;
}

std::string describe(const VXMediaGroup& group) {
    if (isProject(group)) {
        const std::size_t movies = group.mediaObjectCount();
        return std::string(isTrailer(group) ? "trailer" : "project") + " · " +
               (movies > 0 ? counted(movies, "movie") : "not rendered");
    }
    if (group.typeIdentifier() == VXReelixEventGroupTypeIdentifier)
        return counted(group.mediaObjectCount(), "clip");
    const std::string contents = contentsBelow(group).text();
    return contents.empty() ? "empty" : contents;
}

std::string dayOf(const platform::Date& date) {
    const double seconds = std::floor(date.secondsSince1970());
    constexpr double representable = 1e11;  // some three thousand years either way of 1970
    if (!(std::abs(seconds) < representable))
        return {};
    return fmt::format("{:%Y-%m-%d}", fmt::localtime(static_cast<std::time_t>(seconds)));
}

// The days of an event's clips, else the day a project was changed.
std::string datesOf(const VXMediaGroup& group) {
    const auto attributes = group.attributes();
    const platform::Value* oldest = platform::find(*attributes, "ReelixEventOldestClipDate");
    const platform::Value* newest = platform::find(*attributes, "ReelixEventNewestClipDate");
    if (oldest && newest && oldest->date() && newest->date()) {
        const std::string first = dayOf(*oldest->date());
        const std::string last = dayOf(*newest->date());
        return first == last ? first : first + " – " + last;
    }
    const platform::DateRef changed = isProject(group) ? group.modificationDate() : nullptr;
    return changed ? dayOf(*changed) : std::string();
}

std::string lengthOf(const VXMediaObject& mediaObject) {
    const double duration = mediaObject.duration();
    if (!(duration > 0) || duration > 1e9)
        return {};
    const auto seconds = static_cast<long long>(std::llround(duration));
    if (seconds >= 3600)
        return fmt::format("{}:{:02}:{:02}", seconds / 3600, seconds / 60 % 60, seconds % 60);
    return fmt::format("{}:{:02}", seconds / 60, seconds % 60);
}

std::string sizeOf(const VXMediaObject& mediaObject) {
    const auto resolution = mediaObject.attributeForKey(VXMediaObjectResolutionKey);
    if (!resolution || !resolution->size())
        return {};
    return fmt::format("{}×{}", resolution->size()->width, resolution->size()->height);
}

}  // namespace

TextTree::TextTree(const VXMediaGroupRef& root, const TextTreeOptions& options) : options_(options) {
    addRoot(root);
}

void TextTree::addRoot(const VXMediaGroupRef& root) {
    rows_.push_back({"", printable(root->name().value_or(nameless)), Emphasis::group, {describe(*root)}});
    addContent(root, "", options_.depth);
}

void TextTree::addGroup(const VXMediaGroupRef& group, const Place& place, std::optional<int> depth) {
    rows_.push_back({place.guide(),
                     printable(group->name().value_or(nameless)),
                     Emphasis::group,
                     {describe(*group), datesOf(*group)}});
    addContent(group, place.guideBelow(), depth);
}

// The items of a group with children are those that stand for the children, so only the others are listed.
void TextTree::addContent(const VXMediaGroupRef& group, const std::string& guide, std::optional<int> depth) {
    if (depth == 0)
        return;
    const std::optional<int> depthBelow = depth ? std::optional(*depth - 1) : std::nullopt;
    const VXMediaGroupList children = group->childGroups();
    for (std::size_t i = 0; i < children.size(); ++i)
        addGroup(children[i], {guide, i + 1 == children.size()}, depthBelow);
    if (!children.empty())
        return;
    const VXMediaObjectList mediaObjects = group->mediaObjects();
    for (std::size_t i = 0; i < mediaObjects.size(); ++i)
        addItem(mediaObjects[i], {guide, i + 1 == mediaObjects.size()}, isProject(*group));
}

void TextTree::addItem(const VXMediaObjectRef& mediaObject, const Place& place, bool isMovieOfProject) {
    Details details;
    if (isMovieOfProject || options_.withMetadata)
        details = {sizeOf(*mediaObject), lengthOf(*mediaObject)};
    rows_.push_back({place.guide(), printable(mediaObject->name()), Emphasis::item, details});
}

std::size_t TextTree::nameWidth(const OutputStyle& style,
                                const std::array<std::size_t, detailCount>& detailWidths) const {
    std::size_t widest = 0;
    for (const Row& row : rows_)
        widest = std::max(widest, displayWidth(row.guide) + displayWidth(row.name));
    if (!style.width)
        return std::min(widest, widestColumn);
    std::size_t taken = 0;
    for (const std::size_t width : detailWidths)
        taken += width > 0 ? width + gap : 0;
    const std::size_t left = *style.width > taken ? *style.width - taken : 0;
    return std::min(widest, std::max(left, shortestName));
}

void TextTree::print(std::ostream& out, const OutputStyle& style) const {
    std::array<std::size_t, detailCount> widths{};
    for (const Row& row : rows_) {
        for (std::size_t i = 0; i < detailCount; ++i)
            widths[i] = std::max(widths[i], displayWidth(row.details[i]));
    }
    const std::size_t width = nameWidth(style, widths);
    for (const Row& row : rows_) {
        const std::size_t guideWidth = displayWidth(row.guide);
        const std::size_t room = width > guideWidth ? width - guideWidth : 1;
        const std::string name = style.width ? fitted(row.name, room) : row.name;
        std::string details;
        for (std::size_t i = 0; i < detailCount; ++i) {
            if (widths[i] > 0)
                details += std::string(gap, ' ') + padded(row.details[i], widths[i]);
        }
        details.erase(details.find_last_not_of(' ') + 1);
        const std::size_t nameEnd = guideWidth + displayWidth(name);
        const std::string filler =
            details.empty() || nameEnd >= width ? "" : std::string(width - nameEnd, ' ');
        out << style.dim(row.guide) << (row.emphasis == Emphasis::group ? style.bold(name) : name) << filler
            << style.accent(details) << "\n";
    }
}

void printTree(VXMediaManager& manager, const VXMediaGroupRef& root, const TextTreeOptions& options,
               const OutputStyle& style, std::ostream& out) {
    TextTree(root, options).print(out, style);
    if (const auto message = noDataMessage(manager, root))
        out << printable(*message) << "\nRun 'vexo locations' to see where libraries are looked for.\n";
}

}  // namespace vexo
