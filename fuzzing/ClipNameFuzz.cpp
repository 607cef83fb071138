// What a clip's name and its extended attribute say of its date. The input is the name, a line feed, and the
// attribute's value.
#include <algorithm>
#include <cstdint>
#include <fstream>
#include <iterator>

#include "core/VXReelixPlugin.h"
#include "events/ClipDates.h"
#include "framework/BundleStrings.h"
#include "fuzzing/Require.h"

namespace {

// The texts of the plug-in's bundle, and nothing else of it.
class Texts final : public vexo::VXBundle {
  public:
    const std::string& path() const override { return path_; }
    const std::string& identifier() const override { return path_; }
    std::optional<std::string> localizedString(std::string_view key) const override {
        return strings_.stringForKey(key);
    }
    platform::ImageRef iconNamed(std::string_view) const override { return nullptr; }

  private:
    static std::string content(const std::string& path) {
        std::ifstream file(path, std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }

    const std::string path_ = VEXO_SOURCE_DIR "/resources/Resources/Strings.ini";
    const vexo::BundleStrings strings_ = vexo::BundleStrings::withData(content(path_), path_);
};

reelix::ClipNameTexts textsInZoneWithSummerTime() {
    require(setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", /*overwrite=*/1) == 0);
    const reelix::ClipNameTexts texts(reelix::VXReelixPlugin(std::make_shared<Texts>()));
    require(!texts.format.pieces().empty() && !texts.displayFormat.pieces().empty());
    return texts;
}

// A clip that is named after its date is of that date.
void readName(const std::string& name, const reelix::ClipNameTexts& texts) {
    const auto date = reelix::PathDate::dateFromFileName(name, texts);
    if (!date)
        return;
    require(1900 <= date->yearOfCommonEra() && date->yearOfCommonEra() <= 2100);
    const auto locale = platform::Locale::current();
    require(!date->descriptionWithCalendarFormat(texts.displayFormat, locale).empty());
    const auto again = reelix::PathDate::dateFromFileName(
        texts.prefix + date->descriptionWithCalendarFormat(texts.format, locale) + ".mov", texts);
    require(again && again->yearOfCommonEra() == date->yearOfCommonEra());
}

void readAttribute(std::string_view bytes) {
    reelix::ClipDateValue value;
    const auto room = value.room();
    std::copy_n(bytes.begin(), std::min(bytes.size(), room.size()), room.begin());
    if (const auto date = value.date())
        require(date->yearOfCommonEra() >= 0);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const reelix::ClipNameTexts texts = textsInZoneWithSummerTime();
    const std::string_view input(reinterpret_cast<const char*>(data), size);
    const std::size_t end = std::min(input.find('\n'), size);
    readName(std::string(input.substr(0, end)), texts);
    readAttribute(input.substr(std::min(end + 1, size)));
    return 0;
}
