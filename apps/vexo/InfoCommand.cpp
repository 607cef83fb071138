#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/Terminal.h"

namespace vexo {
namespace {

Json jsonPlugin(const LoadedPlugin& plugin) {
    VXMediaManager& manager = *plugin.manager;
    return {{"bundle", jsonText(plugin.bundle->path())},
            {"identifier", jsonText(plugin.bundle->identifier())},
            {"title", jsonText(manager.rootMediaGroupTitle())},
            {"uniqueID", jsonText(manager.uniqueID())},
            {"mediaTypesSupported", manager.mediaTypesSupported()},
            {"managedMediaSource", plugin.principalClass->isManagedMediaSource()},
            {"version", plugin.principalClass->versionNumber},
            {"versionString", jsonText(plugin.principalClass->versionString)},
            {"supportedPasteboardTypes", jsonValue(plugin.principalClass->supportedPasteboardTypes())},
            {"canLoadData", manager.canLoadData()},
            {"appInstalled", manager.appInstalled()}};
}

void printJson(Host& host, std::ostream& out) {
    Json plugins = Json::array();
    for (const LoadedPlugin& plugin : host.plugins())
        plugins.push_back(jsonPlugin(plugin));
    out << Json{{"plugins", plugins},
                {"suitePreferences", jsonText(host.suitePreferencesPath())},
                {"userDefaults", jsonText(host.userDefaultsPath())},
                {"index", jsonText(host.metadataIndexPath())}}
               .dump(2)
        << "\n";
}

const char* yesOrNo(bool answer) {
    return answer ? "yes" : "no";
}

void printText(Host& host, std::ostream& out) {
    const OutputStyle style = OutputStyle::ofStandardOutput();
    for (const LoadedPlugin& plugin : host.plugins()) {
        VXMediaManager& manager = *plugin.manager;
        out << style.bold(printable(manager.rootMediaGroupTitle())) << " "
            << plugin.principalClass->versionNumber << "  " << printable(manager.uniqueID()) << "\n"
            << "  bundle       " << printable(plugin.bundle->path()) << "\n"
            << "  identifier   " << printable(plugin.bundle->identifier()) << "\n"
            << "  application  " << (manager.appInstalled() ? "installed" : "not installed") << "\n"
            << "  can load     " << yesOrNo(manager.canLoadData()) << "\n";
    }
    out << "Suite preferences  " << printable(host.suitePreferencesPath()) << "\n"
        << "User defaults      " << printable(host.userDefaultsPath()) << "\n"
        << "Metadata index     " << printable(host.metadataIndexPath()) << "\n";
}

}  // namespace

Problem runInfo(Host& host, OutputFormat format, std::ostream& out) {
    if (format == OutputFormat::json)
        printJson(host, out);
    else
        printText(host, out);
    return std::nullopt;
}

}  // namespace vexo
