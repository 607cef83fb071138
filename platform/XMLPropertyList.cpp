#include "platform/XMLPropertyList.h"

#include <expat.h>
#include <fmt/format.h>
#include <glib.h>

#include <algorithm>
#include <charconv>
#include <chrono>
#include <exception>
#include <optional>
#include <utility>
#include <vector>

#include "platform/PropertyListLimits.h"

namespace platform {

namespace {

constexpr std::string_view xmlWhitespace = " \t\r\n";

bool isWhitespace(std::string_view text) {
    return text.find_first_not_of(xmlWhitespace) == std::string_view::npos;
}

std::string_view trimmed(std::string_view text) {
    if (isWhitespace(text))
        return {};
    const std::size_t first = text.find_first_not_of(xmlWhitespace);
    return text.substr(first, text.find_last_not_of(xmlWhitespace) - first + 1);
}

// The number that makes up the whole of `text`; nil when it doesn't or is out of range.
template <typename Number, typename... Format>
std::optional<Number> wholeNumber(std::string_view text, Format... format) {
    Number number;
    const auto [end, error] = std::from_chars(text.begin(), text.end(), number, format...);
    if (error != std::errc() || end != text.end())
        return std::nullopt;
    return number;
}

std::string_view withoutPlus(std::string_view text) {
    const bool isSigned = text.starts_with('+') && !text.starts_with("+-");
    return isSigned ? text.substr(1) : text;
}

double realNumber(std::string_view text) {
    const std::optional number = wholeNumber<double>(withoutPlus(trimmed(text)));
    if (!number)
        throw PropertyListError("a real is no number");
    return *number;
}

std::optional<std::uint64_t> hexadecimalNumber(std::string_view text) {
    const bool isHexadecimal = text.starts_with("0x") || text.starts_with("0X");
    return isHexadecimal ? wholeNumber<std::uint64_t>(text.substr(2), 16) : std::nullopt;
}

// Integers beyond 64 bits with sign become reals, as in binary property lists.
Value integerNumber(std::string_view text) {
    text = withoutPlus(trimmed(text));
    if (const auto number = hexadecimalNumber(text))
        return static_cast<std::int64_t>(*number);
    if (const auto number = wholeNumber<std::int64_t>(text))
        return *number;
    if (text.find_first_not_of("-0123456789") != std::string_view::npos)
        throw PropertyListError("an integer is no number");
    return realNumber(text);
}

// The number that `text` begins with, a field of exactly `digits` digits, and the character behind it.
int takeField(std::string_view& text, std::size_t digits, char terminator) {
    const std::optional number = wholeNumber<int>(text.substr(0, digits));
    if (text.size() <= digits || text[digits] != terminator || !number || *number < 0)
        throw PropertyListError("a date is malformed");
    text.remove_prefix(digits + 1);
    return *number;
}

// "2008-12-31T23:59:59Z", always UTC.
DateRef dateFromText(std::string_view text) {
    using namespace std::chrono;
    text = trimmed(text);
    const year_month_day date{year(takeField(text, 4, '-')),
                              month(static_cast<unsigned>(takeField(text, 2, '-'))),
                              day(static_cast<unsigned>(takeField(text, 2, 'T')))};
    const hours hour(takeField(text, 2, ':'));
    const minutes minute(takeField(text, 2, ':'));
    const seconds second(takeField(text, 2, 'Z'));
    if (!date.ok() || hour > 23h || minute > 59min || second > 60s || !text.empty())
        throw PropertyListError("a date is malformed");
    const sys_seconds time = sys_days(date) + hour + minute + second;
    return Date::since1970(static_cast<double>(time.time_since_epoch().count()));
}

Data dataFromBase64(const std::string& text) {
    constexpr std::string_view alphabet =
        "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/= \t\r\n";
    if (text.find_first_not_of(alphabet) != std::string::npos)
        throw PropertyListError("data is not in base 64");
    Data data(text.size() / 4 * 3 + 3);
    gint state = 0;
    guint bits = 0;
    data.resize(g_base64_decode_step(text.data(), text.size(), reinterpret_cast<guchar*>(data.data()), &state,
                                     &bits));
    return data;
}

// A value that is made from the text of its element alone.
std::optional<Value> scalarOfElement(std::string_view element, std::string& text) {
    if (element == "string")
        return std::exchange(text, {});
    if (element == "integer")
        return integerNumber(text);
    if (element == "real")
        return realNumber(text);
    if (element == "date")
        return dateFromText(text);
    if (element == "data")
        return dataFromBase64(text);
    return std::nullopt;
}

bool holdsText(std::string_view element) {
    constexpr std::string_view elements[] = {"key", "string", "integer", "real", "date", "data"};
    return std::ranges::find(elements, element) != std::end(elements);
}

// Builds the value while the elements come by.
class Builder {
  public:
    void beginElement(std::string_view element);
    void addText(std::string_view text);
    void endElement(std::string_view element);
    Value finish();

  private:
    // An array or dictionary whose elements are still coming. Only one of the two lists is used.
    struct Container {
        bool isDictionary;
        Array elements;
        Dictionary entries;
        std::optional<std::string> key;
    };

    bool isAtTop() const { return containers_.empty(); }
    void beginContainer(bool isDictionary);
    void endContainer();
    void endKey();
    void add(Value value);
    void addEntry(Container& dictionary, Value value);

    PropertyListLimits limits_;
    std::vector<Container> containers_;
    std::optional<Value> top_;
    std::string text_;
    bool isInPlist_ = false;
    bool isInText_ = false;
    bool isInEmptyElement_ = false;
};

void Builder::beginElement(std::string_view element) {
    if (isInText_ || isInEmptyElement_ || isInPlist_ == (element == "plist"))
        throw PropertyListError(fmt::format("the element {:.40} is in the wrong place", element));
    if (element == "plist")
        isInPlist_ = true;
    else if (element == "dict" || element == "array")
        beginContainer(element == "dict");
    else if (element == "true" || element == "false")
        isInEmptyElement_ = true;
    else if (holdsText(element))
        isInText_ = true;
    else
        throw PropertyListError(fmt::format("the element {:.40} is unknown", element));
}

void Builder::addText(std::string_view text) {
    if (isInText_) {
        limits_.countBytes(text.size());
        text_ += text;
    } else if (!isWhitespace(text)) {
        throw PropertyListError("there is text between the elements");
    }
}

void Builder::endElement(std::string_view element) {
    if (element == "plist")
        return;
    if (element == "dict" || element == "array")
        return endContainer();
    if (element == "key")
        endKey();
    else
        add(isInEmptyElement_ ? Value(element == "true") : *scalarOfElement(element, text_));
    isInText_ = isInEmptyElement_ = false;
    text_.clear();
}

void Builder::beginContainer(bool isDictionary) {
    PropertyListLimits::checkNesting(static_cast<int>(containers_.size()) + 1);
    containers_.push_back({isDictionary, {}, {}, std::nullopt});
}

void Builder::endContainer() {
    Container container = std::move(containers_.back());
    containers_.pop_back();
    if (container.key)
        throw PropertyListError("a key has no value");
    if (container.isDictionary)
        add(std::move(container.entries));
    else
        add(std::move(container.elements));
}

void Builder::endKey() {
    if (isAtTop() || !containers_.back().isDictionary || containers_.back().key)
        throw PropertyListError("a key is in the wrong place");
    limits_.countValue();
    containers_.back().key = std::exchange(text_, {});
}

void Builder::add(Value value) {
    limits_.countValue();
    if (isAtTop() && top_)
        throw PropertyListError("there is more than one value");
    if (isAtTop())
        top_ = std::move(value);
    else if (containers_.back().isDictionary)
        addEntry(containers_.back(), std::move(value));
    else
        containers_.back().elements.push_back(std::move(value));
}

void Builder::addEntry(Container& dictionary, Value value) {
    if (!dictionary.key)
        throw PropertyListError("a value has no key");
    dictionary.entries.emplace(std::move(*dictionary.key), std::move(value));
    dictionary.key.reset();
}

Value Builder::finish() {
    if (!top_)
        throw PropertyListError("there is no value");
    return std::move(*top_);
}

// Feeds a document to expat and expat's events to a builder. An exception must not pass through expat, which
// is C: it is kept, the parser stopped, and raised again when expat has returned.
class Parser {
  public:
    Parser();
    void feed(std::span<const std::byte> bytes, bool isLast);
    Value finish() { return builder_.finish(); }

  private:
    struct Free {
        void operator()(XML_Parser parser) const { XML_ParserFree(parser); }
    };

    template <typename Step>
    void guarded(Step step) {
        if (failure_)
            return;
        try {
            step(builder_);
        } catch (...) {
            failure_ = std::current_exception();
            XML_StopParser(parser_.get(), XML_FALSE);
        }
    }

    static void XMLCALL elementBegan(void* self, const XML_Char* name, const XML_Char** attributes);
    static void XMLCALL elementEnded(void* self, const XML_Char* name);
    static void XMLCALL textCame(void* self, const XML_Char* text, int length);
    static void XMLCALL entitySkipped(void* self, const XML_Char* name, int isParameterEntity);
    static void XMLCALL entityDeclared(void* self, const XML_Char*, int, const XML_Char*, int,
                                       const XML_Char*, const XML_Char*, const XML_Char*, const XML_Char*);

    std::unique_ptr<XML_ParserStruct, Free> parser_{XML_ParserCreate(nullptr)};
    Builder builder_;
    std::exception_ptr failure_;
};

Parser::Parser() {
    if (!parser_)
        throw std::bad_alloc();
    XML_SetUserData(parser_.get(), this);
    XML_SetElementHandler(parser_.get(), elementBegan, elementEnded);
    XML_SetCharacterDataHandler(parser_.get(), textCame);
    XML_SetEntityDeclHandler(parser_.get(), entityDeclared);
    XML_SetSkippedEntityHandler(parser_.get(), entitySkipped);
}

void Parser::feed(std::span<const std::byte> bytes, bool isLast) {
    const XML_Status status = XML_Parse(parser_.get(), reinterpret_cast<const char*>(bytes.data()),
                                        static_cast<int>(bytes.size()), isLast);
    if (failure_)
        std::rethrow_exception(failure_);
    if (status != XML_STATUS_OK)
        throw PropertyListError(fmt::format("line {}: {}", XML_GetCurrentLineNumber(parser_.get()),
                                            XML_ErrorString(XML_GetErrorCode(parser_.get()))));
}

void Parser::elementBegan(void* self, const XML_Char* name, const XML_Char**) {
    static_cast<Parser*>(self)->guarded([=](Builder& builder) { builder.beginElement(name); });
}

void Parser::elementEnded(void* self, const XML_Char* name) {
    static_cast<Parser*>(self)->guarded([=](Builder& builder) { builder.endElement(name); });
}

void Parser::textCame(void* self, const XML_Char* text, int length) {
    const std::string_view piece(text, static_cast<std::size_t>(length));
    static_cast<Parser*>(self)->guarded([=](Builder& builder) { builder.addText(piece); });
}

// Where a document type outside is named, expat passes over entities that might have been declared there.
void Parser::entitySkipped(void* self, const XML_Char* name, int) {
    static_cast<Parser*>(self)->guarded(
        [=](Builder&) { throw PropertyListError(fmt::format("the entity {:.40} is unknown", name)); });
}

void Parser::entityDeclared(void* self, const XML_Char* name, int, const XML_Char*, int, const XML_Char*,
                            const XML_Char*, const XML_Char*, const XML_Char*) {
    static_cast<Parser*>(self)->guarded(
        [=](Builder&) { throw PropertyListError(fmt::format("the entity {:.40} is declared", name)); });
}

}  // namespace

// Expat scans a token that goes on from piece to piece anew with each; pieces that double in size keep the
// time that a hostile document takes proportional to its length.
Value readXMLPropertyList(ByteSource& source) {
    if (source.size() > PropertyListLimits::largestXML)
        throw PropertyListError("too large for an XML property list");
    constexpr std::uint64_t smallestPiece = 64 * 1024;
    std::vector<std::byte> piece;
    Parser parser;
    for (std::uint64_t offset = 0; offset < source.size(); offset += piece.size()) {
        const std::uint64_t rest = source.size() - offset;
        piece.resize(std::min(rest, std::max(offset, smallestPiece)));
        if (!source.read(offset, piece))
            throw PropertyListError("the file can't be read to its end");
        parser.feed(piece, /*isLast=*/piece.size() == rest);
    }
    return parser.finish();
}

}  // namespace platform
