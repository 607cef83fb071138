#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/PluginIdentity.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/Terminal.h"
#include "apps/vexo/TextTree.h"

namespace vexo {
namespace {

Json jsonPlugin(const LoadedPlugin& plugin, const TreeOptions& options) {
    VXMediaManager& manager = *plugin.manager;
    const PluginIdentity identity = identityOf(plugin);
    JsonTreeWriter writer(manager, options.withMetadata ? MetadataOutput::include : MetadataOutput::leaveOut);
    const VXMediaGroupRef root = manager.rootMediaGroup();
    Json json{{"title", jsonText(identity.title)},
              {"uniqueID", jsonText(identity.uniqueID)},
              {"mediaTypesSupported", identity.mediaTypesSupported},
              {"managedMediaSource", identity.isManagedMediaSource},
              {"version", plugin.principalClass->versionNumber},
              {"canLoadData", identity.canLoadData},
              {"appInstalled", identity.appInstalled},
              {"defaultNoDataMessage", jsonText(noDataMessage(manager, root))},
              {"root", root ? writer.group(root, options.depth) : Json()}};
    json["mediaGroups"] = writer.mediaGroups();
    return json;
}

void printJson(Host& host, const TreeOptions& options, std::ostream& out) {
    Json plugins = Json::array();
    for (const LoadedPlugin& plugin : host.plugins())
        plugins.push_back(jsonPlugin(plugin, options));
    Json warnings = Json::array();
    for (const std::string& warning : host.diagnostics().warnings())
        warnings.push_back(jsonText(warning));
    out << Json{{"plugins", plugins}, {"warnings", warnings}}.dump(2) << "\n";
}

void printText(Host& host, const TreeOptions& options, std::ostream& out) {
    const OutputStyle style = OutputStyle::ofStandardOutput();
    for (const LoadedPlugin& plugin : host.plugins()) {
        if (const VXMediaGroupRef root = plugin.manager->rootMediaGroup())
            printTree(*plugin.manager, root, {options.depth, options.withMetadata}, style, out);
    }
}

// Why it has no tree is among the warnings.
Problems pluginsWithoutTree(const Host& host) {
    Problems problems;
    for (const LoadedPlugin& plugin : host.plugins())
        if (!plugin.manager->rootMediaGroup())
            problems.push_back("the plug-in '" + plugin.bundle->path() + "' could not read the libraries");
    return problems;
}

}  // namespace

Problems runTree(Host& host, const TreeOptions& options, std::ostream& out) {
    loadWithProgress(host);
    if (options.withMetadata)
        readMetadataWithProgress(host);
    if (options.format == OutputFormat::json)
        printJson(host, options, out);
    else
        printText(host, options, out);
    return pluginsWithoutTree(host);
}

}  // namespace vexo
