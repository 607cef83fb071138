// The texts of a bundle by key, in the user's language.
//
// They lie in a key file, group [Strings], as `Key=text` in English and `Key[de]=text` in other languages.
// Such a file is used as it is written: it needs no compiled catalogue, no installed locale and no setlocale,
// and a key that is missing is missing, where a catalogue answers the key itself.
//
// Immutable, so callable from any thread.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>

namespace vexo {

class BundleStrings {
  public:
    // Neither fails: what can't be read leaves its keys without text and is told by `warning`. A file of more
    // than 1 MiB is not read.
    static BundleStrings withContentsOfFile(const std::string& path);
    static BundleStrings withData(std::string_view data, const std::string& name);

    // The text in the first of the user's languages that has one, else the English text; nil for a key
    // without English text. The languages are those that LANGUAGE, LC_ALL, LC_MESSAGES and LANG name at the
    // moment of the call.
    std::optional<std::string> stringForKey(std::string_view key) const;

    // What was wrong with the file, or the first such thing; empty when nothing was.
    const std::string& warning() const { return warning_; }

  private:
    struct Text {
        std::optional<std::string> english;
        std::map<std::string, std::string, std::less<>> translations;  // by language
    };

    void addText(std::string_view keyWithLanguage, std::string text);
    void warn(std::string warning);

    std::map<std::string, Text, std::less<>> texts_;
    std::string warning_;
};

}  // namespace vexo
