#include "tests/support/TreeText.h"

namespace testing_support {
namespace {

// "VXReelixEventGroupTypeIdentifier" -> "Event"
std::string typeName(const vexo::VXMediaGroup& group) {
    const std::string text = group.typeIdentifier().text();
    const std::string prefix = "VXReelix";
    const std::string suffix = "GroupTypeIdentifier";
    return text.substr(prefix.size(), text.size() - prefix.size() - suffix.size());
}

std::string groupLine(const vexo::VXMediaGroup& group) {
    const platform::ImageRef icon = group.icon();
    std::string line = typeName(group) + " " + group.ID().value_or("<none>") + " \"" +
                       group.name().value_or("<none>") + "\" <" + group.parentID().value_or("none") +
                       "> icon=" + (icon ? icon->name() : "none");
    const auto attributes = group.attributes();
    const platform::Value* year = platform::find(*attributes, "ReelixEventCreationYear");
    if (year && year->integer())
        line += " year=" + std::to_string(*year->integer());
    return line + "\n";
}

void write(const vexo::VXMediaGroup& group, const std::string& indentation, std::string& text) {
    text += indentation + groupLine(group);
    const std::string below = indentation + "  ";
    if (const auto mediaObjects = group.ownMediaObjects()) {
        for (const vexo::VXMediaObjectRef& mediaObject : *mediaObjects)
            text += below + "* " + mediaObject->ID() + " \"" + mediaObject->name() + "\"\n";
    }
    for (const vexo::VXMediaGroupRef& child : group.childGroups())
        write(*child, below, text);
}

void replaceAll(std::string& text, const std::string& from, const std::string& to) {
    for (std::size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
        text.replace(at, from.size(), to);
}

}  // namespace

std::string treeText(const vexo::VXMediaGroupRef& root, const std::string& homePath) {
    if (!root)
        return "<no tree>\n";
    std::string text;
    write(*root, "", text);
    replaceAll(text, homePath, "home");
    return text;
}

}  // namespace testing_support
