#include <span>
#include <sstream>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/OutputFile.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/Terminal.h"
#include "apps/vexo/TreeLookup.h"
#include "framework/GuardedWork.h"
#include "platform/PropertyList.h"
#include "platform/Text.h"

namespace vexo {
namespace {

// What is copied: of one plug-in, either items or groups.
struct Selection {
    std::shared_ptr<VXMediaManager> manager;
    std::vector<VXMediaObjectRef> mediaObjects;
    std::vector<VXMediaGroupRef> mediaGroups;

    // False for things of a second plug-in, whose data would take the place of the first one's.
    bool belongsTo(const std::shared_ptr<VXMediaManager>& plugin) {
        if (!manager)
            manager = plugin;
        return manager == plugin;
    }
};

struct Copied {
    bool result = false;
    platform::Pasteboard pasteboard;
};

constexpr const char* severalPlugins =
    "things of several plug-ins cannot be copied together; copy those of one";

Problem select(const TreeLookup& lookup, const CopyOptions& options, Selection& selection) {
    for (const std::string& id : options.objects) {
        const FoundObject* found = lookup.objectWithID(id);
        if (!found)
            return TreeLookup::noObjectProblem(id);
        if (!selection.belongsTo(found->manager))
            return severalPlugins;
        selection.mediaObjects.push_back(found->mediaObject);
    }
    for (const std::string& id : options.groups) {
        const FoundGroup* found = lookup.groupWithID(id);
        if (!found)
            return TreeLookup::noGroupProblem(id);
        if (!selection.belongsTo(found->manager))
            return severalPlugins;
        selection.mediaGroups.push_back(found->mediaGroup);
    }
    return std::nullopt;
}

Problem copy(const Selection& selection, Copied& copied) {
    const bool ended = runGuarded([&] {
        copied = {};  // a second attempt begins anew
        VXMediaManager& plugin = *selection.manager;
        copied.result = selection.mediaGroups.empty()
                            ? plugin.writeMediaObjects(selection.mediaObjects, copied.pasteboard)
                            : plugin.writeMediaGroups(selection.mediaGroups, copied.pasteboard);
    });
    return ended ? std::nullopt : Problem("the plug-in could not say what it copies");
}

std::string joined(const std::vector<std::string>& texts, const std::string& separator) {
    std::string result;
    for (const std::string& text : texts)
        result += (result.empty() ? "" : separator) + text;
    return result;
}

std::vector<std::string> linesOfText(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        if (line.ends_with('\r'))
            line.pop_back();
        lines.push_back(line);
    }
    return lines;
}

bool isOneLine(const Json& value) {
    return value.empty() || !value.is_structured();
}

std::vector<std::string> linesOf(const Json& value);

void appendEntry(std::vector<std::string>& lines, const std::string& key, const Json& value) {
    const std::vector<std::string> content = linesOf(value);
    if (isOneLine(value)) {
        lines.push_back(key + ": " + content.front());
        return;
    }
    lines.push_back(key + ":");
    for (const std::string& line : content)
        lines.push_back("  " + line);
}

void appendElement(std::vector<std::string>& lines, const Json& value) {
    const char* mark = "- ";
    for (const std::string& line : linesOf(value)) {
        lines.push_back(mark + line);
        mark = "  ";
    }
}

// A property list with an entry on each line. Never empty.
std::vector<std::string> linesOf(const Json& value) {
    if (value.is_string())
        return {value.get<std::string>()};
    if (isOneLine(value))
        return {value.is_structured() ? "(empty)" : value.dump()};
    std::vector<std::string> lines;
    for (const auto& [key, element] : value.items()) {
        if (value.is_object())
            appendEntry(lines, key, element);
        else
            appendElement(lines, element);
    }
    return lines;
}

std::string textAnswer(const Copied& copied, const OutputStyle& style) {
    if (copied.pasteboard.types().empty())
        return "nothing to copy\n";
    std::string answer;
    for (const std::string& type : copied.pasteboard.types()) {
        const auto value = copied.pasteboard.valueForType(type);
        if (!value)
            continue;
        answer += style.bold(printable(type)) + "\n";
        for (const std::string& line :
             value->string() ? linesOfText(*value->string()) : linesOf(jsonValue(*value)))
            answer += "  " + printable(line) + "\n";
    }
    return answer;
}

std::string jsonAnswer(const Copied& copied) {
    Json types = Json::object();
    for (const std::string& type : copied.pasteboard.types()) {
        if (const auto value = copied.pasteboard.valueForType(type))
            types[platform::validUTF8(type)] = jsonValue(*value);
    }
    return Json{{"result", copied.result}, {"types", types}}.dump(2) + "\n";
}

std::string bytesOf(const platform::Value& value) {
    if (const std::string* text = value.string())
        return *text;
    const platform::Data bytes = dataWithPropertyList(value, platform::PropertyListFormat::xml);
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

std::string missingTypeProblem(const std::string& type, const platform::Pasteboard& pasteboard) {
    const std::string offer = pasteboard.types().empty() ? "there is none" : joined(pasteboard.types(), ", ");
    return "the type '" + type + "' is not among those copied: " + offer;
}

Problem answer(const Copied& copied, const CopyOptions& options, std::string& text) {
    if (options.type) {
        const auto value = copied.pasteboard.valueForType(*options.type);
        if (!value)
            return missingTypeProblem(*options.type, copied.pasteboard);
        text = bytesOf(*value);
    } else if (options.format == OutputFormat::json) {
        text = jsonAnswer(copied);
    } else {
        text = textAnswer(copied, options.outputFile ? OutputStyle() : OutputStyle::ofStandardOutput());
    }
    return std::nullopt;
}

Problem copyTo(Host& host, const CopyOptions& options, std::ostream& out) {
    Selection selection;
    if (Problem problem = select(TreeLookup(host), options, selection))
        return problem;
    Copied copied;
    if (Problem problem = copy(selection, copied))
        return problem;
    std::string text;
    if (Problem problem = answer(copied, options, text))
        return problem;
    if (options.outputFile)
        return writeFile(*options.outputFile, std::as_bytes(std::span(text)));
    out << text;
    return std::nullopt;
}

}  // namespace

Problems runCopy(Host& host, const CopyOptions& options, std::ostream& out) {
    loadWithProgress(host);
    const Problem problem = copyTo(host, options, out);
    return problem ? Problems{*problem} : Problems{};
}

}  // namespace vexo
