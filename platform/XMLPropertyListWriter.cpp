#include <fmt/format.h>
#include <glib.h>

#include <algorithm>
#include <cmath>
#include <memory>
#include <span>
#include <string>

#include "platform/Date.h"
#include "platform/PropertyListWriters.h"
#include "platform/Text.h"

namespace platform {

namespace {

constexpr std::string_view replacementCharacter = "\uFFFD";

std::string textOfReal(double number) {
    if (std::isnan(number))
        return "nan";
    if (std::isinf(number))
        return number < 0 ? "-infinity" : "+infinity";
    return fmt::format("{}", number);
}

// The form has four digits for a year: other dates become the nearest one that it can say.
std::string textOfDate(const Date& date) {
    const double earliest = -62135596800;  // 0001-01-01T00:00:00Z
    const double latest = 253402300799;    // 9999-12-31T23:59:59Z
    const double seconds = date.secondsSince1970();
    const double writable = std::isnan(seconds) ? 0.0 : std::clamp(seconds, earliest, latest);
    return iso8601String(*Date::since1970(writable));
}

std::string textOfData(std::span<const std::byte> data) {
    const std::unique_ptr<gchar, decltype(&g_free)> text(
        g_base64_encode(reinterpret_cast<const guchar*>(data.data()), data.size()), g_free);
    return text.get();
}

// U+FFFE and U+FFFF are no characters of XML.
bool beginsWithNonCharacter(std::string_view text) {
    return text.starts_with("\uFFFE") || text.starts_with("\uFFFF");
}

bool isControl(char c) {
    return static_cast<unsigned char>(c) < 0x20 && c != '\t' && c != '\n' && c != '\r';
}

// Whether XML can carry the text.
bool isText(std::string_view text) {
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (isControl(text[i]) || beginsWithNonCharacter(text.substr(i)))
            return false;
    }
    return isValidUTF8(text);
}

// Requires: the text is UTF-8.
std::string escaped(std::string_view text) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char c = text[i];
        if (c == '&')
            result += "&amp;";
        else if (c == '<')
            result += "&lt;";
        else if (c == '>')
            result += "&gt;";
        else if (c == '\r')
            result += "&#13;";  // written plainly, a reader would make it a line feed
        else if (isControl(c))
            result += replacementCharacter;
        else if (beginsWithNonCharacter(text.substr(i)))
            result += replacementCharacter, i += replacementCharacter.size() - 1;
        else
            result += c;
    }
    return result;
}

class Writer {
  public:
    void write(const Value& propertyList);
    std::string take() { return std::move(text_); }

  private:
    void put(const Value& value);
    void putScalar(const Value& value);
    void putArray(const Array& array);
    void putDictionary(const Dictionary& dictionary);
    void putElement(std::string_view name, std::string_view content);
    void putString(std::string_view text);
    void putText(std::string_view name, std::string_view text);
    void putLine(std::string_view line);

    std::string text_;
    std::size_t nesting_ = 0;
};

void Writer::write(const Value& propertyList) {
    putLine(R"(<?xml version="1.0" encoding="UTF-8"?>)");
    putLine(R"(<plist version="1.0">)");
    put(propertyList);
    putLine("</plist>");
}

void Writer::put(const Value& value) {
    if (const Array* array = value.array())
        putArray(*array);
    else if (const Dictionary* dictionary = value.dictionary())
        putDictionary(*dictionary);
    else
        putScalar(value);
}

void Writer::putScalar(const Value& value) {
    if (const bool* truth = value.boolean())
        putLine(*truth ? "<true/>" : "<false/>");
    else if (const std::int64_t* number = value.integer())
        putElement("integer", fmt::format("{}", *number));
    else if (const double* real = value.real())
        putElement("real", textOfReal(*real));
    else if (const std::string* text = value.string())
        putString(*text);
    else if (const Size* size = value.size())
        putText("string", stringFromSize(*size));
    else if (const DateRef date = value.date())
        putElement("date", textOfDate(*date));
    else
        putElement("data", textOfData(*value.data()));
}

void Writer::putArray(const Array& array) {
    putLine("<array>");
    ++nesting_;
    for (const Value& element : array)
        put(element);
    --nesting_;
    putLine("</array>");
}

void Writer::putDictionary(const Dictionary& dictionary) {
    putLine("<dict>");
    ++nesting_;
    for (const auto& [key, value] : dictionary) {
        putText("key", key);
        put(value);
    }
    --nesting_;
    putLine("</dict>");
}

void Writer::putElement(std::string_view name, std::string_view content) {
    putLine(fmt::format("<{}>{}</{}>", name, content, name));
}

// A path is bytes and need not be text. Without all of them its file could not be found.
void Writer::putString(std::string_view text) {
    if (isText(text))
        putText("string", text);
    else
        putElement("data", textOfData(std::as_bytes(std::span(text))));
}

void Writer::putText(std::string_view name, std::string_view text) {
    putElement(name, escaped(validUTF8(text)));
}

void Writer::putLine(std::string_view line) {
    text_.append(nesting_, '\t').append(line).append("\n");
}

}  // namespace

std::vector<std::byte> xmlPropertyList(const Value& propertyList) {
    Writer writer;
    writer.write(propertyList);
    const std::string text = writer.take();
    const std::span bytes = std::as_bytes(std::span(text));
    return {bytes.begin(), bytes.end()};
}

}  // namespace platform
