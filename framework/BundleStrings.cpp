#include "framework/BundleStrings.h"

#include <fmt/format.h>
#include <glib.h>

#include "platform/FileManager.h"
#include "platform/Services.h"

namespace vexo {

namespace {

constexpr const char* stringsGroup = "Strings";

struct Free {
    void operator()(GKeyFile* keyFile) const { g_key_file_free(keyFile); }
    void operator()(GError* error) const { g_error_free(error); }
    void operator()(char** strings) const { g_strfreev(strings); }
    void operator()(char* string) const { g_free(string); }
};
template <typename T>
using Owned = std::unique_ptr<T, Free>;

// Keeps all languages, not only the user's: those may change.
Owned<GKeyFile> parse(std::string_view data, GError** error) {
    Owned<GKeyFile> keyFile(g_key_file_new());
    const auto flags = G_KEY_FILE_KEEP_TRANSLATIONS;
    if (!g_key_file_load_from_data(keyFile.get(), data.data(), data.size(), flags, error))
        return nullptr;
    return keyFile;
}

Owned<char*> keysOf(GKeyFile* keyFile, GError** error) {
    return Owned<char*>(keyFile ? g_key_file_get_keys(keyFile, stringsGroup, nullptr, error) : nullptr);
}

// nil for text that is no UTF-8 and for a wrong escape; the latter is answered along with its error.
std::optional<std::string> textOf(GKeyFile* keyFile, const char* key) {
    GError* error = nullptr;
    const Owned<char> text(g_key_file_get_string(keyFile, stringsGroup, key, &error));
    const Owned<GError> owned(error);
    if (error)
        return std::nullopt;
    return text.get();
}

}  // namespace

BundleStrings BundleStrings::withContentsOfFile(const std::string& path) {
    constexpr std::uint64_t mostBytes = 1024 * 1024;
    const auto data = platform::services().fileManager.contentsAtPath(path, mostBytes);
    if (data)
        return withData({reinterpret_cast<const char*>(data->data()), data->size()}, path);
    BundleStrings strings;
    strings.warn(fmt::format("{}: no file of at most {} bytes that can be read", path, mostBytes));
    return strings;
}

BundleStrings BundleStrings::withData(std::string_view data, const std::string& name) {
    BundleStrings strings;
    GError* error = nullptr;
    const Owned<GKeyFile> keyFile = parse(data, &error);
    const Owned<char*> keys = keysOf(keyFile.get(), &error);
    if (const Owned<GError> owned{error})
        strings.warn(fmt::format("{}: {}", name, owned->message));
    for (char** key = keys.get(); key && *key; ++key) {
        if (auto text = textOf(keyFile.get(), *key))
            strings.addText(*key, *std::move(text));
        else
            strings.warn(fmt::format("{}: the text of {} is damaged", name, *key));
    }
    return strings;
}

std::optional<std::string> BundleStrings::stringForKey(std::string_view key) const {
    const auto found = texts_.find(key);
    if (found == texts_.end() || !found->second.english)
        return std::nullopt;
    const Text& text = found->second;
    if (text.translations.empty())
        return text.english;
    for (const char* const* language = g_get_language_names(); *language; ++language) {
        // English has no translations, but must stop the search for those who prefer it to another language.
        if (std::string_view(*language) == "en")
            break;
        if (const auto translation = text.translations.find(*language);
            translation != text.translations.end())
            return translation->second;
    }
    return text.english;
}

void BundleStrings::addText(std::string_view keyWithLanguage, std::string text) {
    const std::size_t bracket = keyWithLanguage.find('[');
    Text& entry = texts_[std::string(keyWithLanguage.substr(0, bracket))];
    if (bracket == std::string_view::npos) {
        entry.english = std::move(text);
        return;
    }
    const std::string_view language = keyWithLanguage.substr(bracket + 1);
    entry.translations[std::string(language.substr(0, language.find(']')))] = std::move(text);
}

void BundleStrings::warn(std::string warning) {
    if (warning_.empty())
        warning_ = std::move(warning);
}

}  // namespace vexo
