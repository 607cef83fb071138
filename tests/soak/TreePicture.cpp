#include "tests/soak/TreePicture.h"

#include <algorithm>
#include <iterator>
#include <set>

namespace soak {
namespace {

using vexo::VXMediaGroup;

std::string text(const std::optional<std::string>& value) {
    return value ? "'" + *value + "'" : "none";
}

std::string lineOf(const VXMediaGroup& group) {
    std::string line = std::string(group.typeIdentifier().text()) + " " + text(group.ID()) + " " +
                       text(group.name()) + " in " + text(group.parentID()) + " at " + text(group.path());
    const auto attributes = group.attributes();
    const platform::Value* year = platform::find(*attributes, "ReelixEventCreationYear");
    return line + (year && year->integer() ? " of " + std::to_string(*year->integer()) : "");
}

std::string lineOf(const vexo::VXMediaObject& item) {
    return "* '" + item.ID() + "' '" + item.name() + "' at " + text(item.path());
}

void addItems(const VXMediaGroup& group, const std::string& indentation, TreePicture& lines) {
    for (const vexo::VXMediaObjectRef& item : group.ownMediaObjects().value_or(vexo::VXMediaObjectList()))
        lines.push_back(indentation + lineOf(*item));
}

void add(const VXMediaGroup& group, const std::string& indentation, TreePicture& lines) {
    lines.push_back(indentation + lineOf(group));
    addItems(group, indentation + "  ", lines);
    for (const vexo::VXMediaGroupRef& child : group.childGroups())
        add(*child, indentation + "  ", lines);
}

std::vector<vexo::VXMediaGroupRef> sortedById(const vexo::VXMediaGroupList& groups) {
    std::vector<vexo::VXMediaGroupRef> sorted(groups.begin(), groups.end());
    std::stable_sort(sorted.begin(), sorted.end(),
                     [](const auto& one, const auto& other) { return one->ID() < other->ID(); });
    return sorted;
}

std::string excerpt(const char* title, const std::multiset<std::string>& lines,
                    const std::multiset<std::string>& others) {
    constexpr std::size_t most = 20;
    std::vector<std::string> only;
    std::set_difference(lines.begin(), lines.end(), others.begin(), others.end(), std::back_inserter(only));
    std::string text = std::string(title) + ": " + std::to_string(only.size()) + " lines\n";
    for (std::size_t i = 0; i < std::min(most, only.size()); ++i)
        text += "    " + only[i] + "\n";
    return text;
}

}  // namespace

TreePicture pictureOf(const vexo::VXMediaGroupRef& root) {
    TreePicture lines;
    if (!root)
        return {"no tree"};
    lines.push_back(lineOf(*root));
    addItems(*root, "", lines);
    std::sort(lines.begin() + 1, lines.end());
    for (const vexo::VXMediaGroupRef& child : sortedById(root->childGroups()))
        add(*child, "  ", lines);
    return lines;
}

std::string difference(const TreePicture& seen, const TreePicture& expected) {
    if (seen == expected)
        return {};
    const std::multiset<std::string> seenLines(seen.begin(), seen.end());
    const std::multiset<std::string> expectedLines(expected.begin(), expected.end());
    if (seenLines == expectedLines)
        return "the same lines in another order\n";
    return excerpt("only in the tree", seenLines, expectedLines) +
           excerpt("only in the fresh one", expectedLines, seenLines);
}

}  // namespace soak
