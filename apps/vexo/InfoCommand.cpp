#include <fmt/format.h>

#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/PluginIdentity.h"
#include "apps/vexo/Terminal.h"
#include "framework/metadata/MediaReader.h"

namespace vexo {
namespace {

Json jsonPlugin(const LoadedPlugin& plugin) {
    const PluginIdentity identity = identityOf(plugin);
    return {{"bundle", jsonText(plugin.bundle->path())},
            {"identifier", jsonText(plugin.bundle->identifier())},
            {"title", jsonText(identity.title)},
            {"uniqueID", jsonText(identity.uniqueID)},
            {"mediaTypesSupported", identity.mediaTypesSupported},
            {"managedMediaSource", identity.isManagedMediaSource},
            {"version", plugin.principalClass->versionNumber},
            {"versionString", jsonText(plugin.principalClass->versionString)},
            {"supportedPasteboardTypes", jsonValue(identity.supportedPasteboardTypes)},
            {"canLoadData", identity.canLoadData},
            {"appInstalled", identity.appInstalled}};
}

Json jsonMediaReader(Host& host) {
    const auto confinement = host.mediaReaderConfinement();
    return {{"program", jsonText(mediaReaderProgram())},
            {"confinement", confinement ? Json(*confinement) : Json()}};
}

void printJson(Host& host, const InfoOptions& options, std::ostream& out) {
    Json plugins = Json::array();
    for (const LoadedPlugin& plugin : host.plugins())
        plugins.push_back(jsonPlugin(plugin));
    Json json{{"plugins", plugins},
              {"suitePreferences", jsonText(host.suitePreferencesPath())},
              {"userDefaults", jsonText(host.userDefaultsPath())},
              {"index", jsonText(host.metadataIndexPath())}};
    if (options.withMediaReader)
        json["mediaReader"] = jsonMediaReader(host);
    out << json.dump(2) << "\n";
}

const char* yesOrNo(bool answer) {
    return answer ? "yes" : "no";
}

void printMediaReader(Host& host, std::ostream& out) {
    const auto confinement = host.mediaReaderConfinement();
    out << "Media reader       " << printable(mediaReaderProgram()) << "\n"
        << "  confined by      "
        << (confinement ? fmt::format("{}", fmt::join(*confinement, ", ")) : "(it cannot be started)")
        << "\n";
}

void printText(Host& host, const InfoOptions& options, std::ostream& out) {
    const OutputStyle style = OutputStyle::ofStandardOutput();
    for (const LoadedPlugin& plugin : host.plugins()) {
        const PluginIdentity identity = identityOf(plugin);
        out << style.bold(printable(identity.title)) << " " << plugin.principalClass->versionNumber << "  "
            << printable(identity.uniqueID) << "\n"
            << "  bundle       " << printable(plugin.bundle->path()) << "\n"
            << "  identifier   " << printable(plugin.bundle->identifier()) << "\n"
            << "  application  " << (identity.appInstalled ? "installed" : "not installed") << "\n"
            << "  can load     " << yesOrNo(identity.canLoadData) << "\n";
    }
    out << "Suite preferences  " << printable(host.suitePreferencesPath()) << "\n"
        << "User defaults      " << printable(host.userDefaultsPath()) << "\n"
        << "Metadata index     " << printable(host.metadataIndexPath()) << "\n";
    if (options.withMediaReader)
        printMediaReader(host, out);
}

}  // namespace

Problems runInfo(Host& host, const InfoOptions& options, std::ostream& out) {
    if (options.format == OutputFormat::json)
        printJson(host, options, out);
    else
        printText(host, options, out);
    return {};
}

}  // namespace vexo
