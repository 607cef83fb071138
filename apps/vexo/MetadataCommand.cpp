#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/Paths.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/Terminal.h"
#include "framework/metadata/MetadataStore.h"

namespace vexo {
namespace {

// What is known of one file.
struct Description {
    std::string path;
    bool isSupported;
    platform::Dictionary properties;
    Problem problem;  // why it is no movie that can be read
};

// Why a file is no movie is found out by reading it, so that its properties are known as well.
Description descriptionOf(const std::string& file, const MetadataStore& metadata) {
    const std::string path = absolutePath(file);
    Description description{path, metadata.supportedMovieFile(path), {}, metadata.problemWithFile(path)};
    description.properties = metadata.propertiesForFile(path)->allValues();
    return description;
}

Json jsonOf(const Description& description) {
    const platform::Value* contentType = platform::find(description.properties, kMDItemContentType);
    return {{"path", jsonText(description.path)},
            {"supportedMovieFile", description.isSupported},
            {"contentType", contentType ? jsonValue(*contentType) : Json()},
            {"properties", jsonValues(description.properties)},
            {"problem", jsonText(description.problem)}};
}

std::string textOf(const Json& value) {
    if (value.is_string())
        return value.get<std::string>();
    if (!value.is_array())
        return value.dump();
    std::string list;
    for (const Json& element : value)
        list += (list.empty() ? "" : ", ") + textOf(element);
    return list;
}

void printText(const Description& description, std::ostream& out) {
    const OutputStyle style = OutputStyle::ofStandardOutput();
    std::size_t keyWidth = 0;
    for (const auto& property : description.properties)
        keyWidth = std::max(keyWidth, displayWidth(property.first));
    out << style.bold(printable(description.path)) << "\n";
    for (const auto& [key, value] : description.properties)
        out << "  " << style.dim(padded(key, keyWidth)) << "  " << printable(textOf(jsonValue(value)))
            << "\n";
}

}  // namespace

Problems runMetadata(Host& host, const std::vector<std::string>& files, OutputFormat format,
                     std::ostream& out) {
    Problems problems;
    Json documents = Json::array();
    ProgressLine line;
    for (const std::string& file : files) {
        line.show("Reading " + printable(file));
        const Description description = descriptionOf(file, host.metadata());
        if (description.problem)
            problems.push_back(file + ": " + *description.problem);
        if (format == OutputFormat::json)
            documents.push_back(jsonOf(description));
        else if (!description.properties.empty())
            printText(description, out);
    }
    if (format == OutputFormat::json)
        out << documents.dump(2) << "\n";
    return problems;
}

}  // namespace vexo
