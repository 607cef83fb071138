#include "framework/metadata/ReaderMessage.h"

#include <algorithm>
#include <cmath>
#include <nlohmann/json.hpp>

#include "framework/metadata/MediaLimits.h"

namespace vexo {

namespace {

using Json = nlohmann::json;

// Raised and caught in this file.
struct NotUnderstood {};

void require(bool condition) {
    if (!condition)
        throw NotUnderstood();
}

// The object that `text` is, or nil.
std::optional<Json> objectIn(std::string_view text) {
    if (text.size() > maximumMessageBytes)
        return std::nullopt;
    Json json = Json::parse(text, nullptr, /*allow_exceptions=*/false);
    return json.is_object() ? std::optional(std::move(json)) : std::nullopt;
}

// Runs a decoding function on the object that `text` is; nil where either fails.
template <typename Decode>
auto decoded(std::string_view text, Decode decode) -> std::optional<decltype(decode(Json()))> {
    const auto object = objectIn(text);
    if (!object)
        return std::nullopt;
    try {
        return decode(*object);
    } catch (const NotUnderstood&) {
        return std::nullopt;
    }
}

std::string printed(const Json& json) {
    return json.dump(-1, ' ', false, Json::error_handler_t::replace);
}

// --- Texts

// Bytes that are no UTF-8 become U+FFFD.
std::string wellFormed(const std::string& text) {
    return Json::parse(printed(text)).get<std::string>();
}

bool isInsideCharacter(char byte) {
    return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

std::string cutBetweenCharacters(std::string text, std::size_t longest) {
    if (text.size() <= longest)
        return text;
    while (longest > 0 && isInsideCharacter(text[longest]))
        --longest;
    text.resize(longest);
    return text;
}

std::string beginningOf(const std::string& text, std::size_t longest) {
    // Bad bytes grow, so the rest of a very long text need not be looked at.
    return cutBetweenCharacters(wellFormed(text.substr(0, longest + 4)), longest);
}

// The bytes of the control character that well-formed text has at `at`; 0 for any other.
std::size_t controlCharacterAt(std::string_view text, std::size_t at) {
    const auto byte = static_cast<unsigned char>(text[at]);
    if (byte < 0x20 || byte == 0x7F)
        return 1;
    const bool isSecondSet = byte == 0xC2 && static_cast<unsigned char>(text[at + 1]) < 0xA0;
    return isSecondSet ? 2 : 0;
}

bool hasControlCharacters(std::string_view text) {
    for (std::size_t at = 0; at < text.size(); ++at)
        if (controlCharacterAt(text, at) > 0)
            return true;
    return false;
}

std::string withoutControlCharacters(std::string_view text) {
    std::string rest;
    for (std::size_t at = 0; at < text.size();) {
        const std::size_t size = controlCharacterAt(text, at);
        if (size == 0)
            rest += text[at];
        at += std::max<std::size_t>(size, 1);
    }
    return rest;
}

// --- Decoding

std::uint64_t naturalNumber(const Json& object, const char* key) {
    const auto found = object.find(key);
    require(found != object.end() && found->is_number_unsigned());
    return found->get<std::uint64_t>();
}

std::optional<double> real(const Json& object, const char* key, const Range& range) {
    const auto found = object.find(key);
    if (found == object.end())
        return std::nullopt;
    require(found->is_number());
    const double number = found->get<double>();
    require(range.contains(number));
    return number;
}

template <typename Number>
std::optional<Number> whole(const Json& object, const char* key, const Range& range) {
    const auto found = object.find(key);
    if (found == object.end())
        return std::nullopt;
    require(found->is_number_unsigned());
    const auto number = found->get<std::uint64_t>();
    require(range.contains(static_cast<double>(number)));
    return static_cast<Number>(number);
}

std::string text(const Json& json, std::size_t longest) {
    require(json.is_string() && json.get_ref<const std::string&>().size() <= longest);
    return json.get<std::string>();
}

std::optional<std::string> title(const Json& object, const char* key) {
    const auto found = object.find(key);
    if (found == object.end())
        return std::nullopt;
    std::string title = text(*found, longestText);
    require(!title.empty() && !hasControlCharacters(title));
    return title;
}

std::vector<std::string> names(const Json& object, const char* key) {
    const auto found = object.find(key);
    if (found == object.end())
        return {};
    require(found->is_array() && found->size() <= longestList);
    std::vector<std::string> list;
    for (const Json& entry : *found) {
        list.push_back(text(entry, longestName));
        require(!hasControlCharacters(list.back()));
    }
    return list;
}

MediaProperties propertiesIn(const Json& object) {
    MediaProperties properties;
    properties.mediaTypes = names(object, "mediaTypes");
    properties.pixelWidth = whole<int>(object, "pixelWidth", pixelCounts);
    properties.pixelHeight = whole<int>(object, "pixelHeight", pixelCounts);
    properties.durationSeconds = real(object, "durationSeconds", durations);
    properties.codecs = names(object, "codecs");
    properties.contentCreationDate = real(object, "contentCreationDate", dates);
    properties.frameRate = real(object, "frameRate", frameRates);
    properties.audioChannelCount = whole<int>(object, "audioChannelCount", channelCounts);
    properties.audioSampleRate = whole<int>(object, "audioSampleRate", sampleRates);
    properties.totalBitRate = whole<std::int64_t>(object, "totalBitRate", bitRates);
    properties.title = title(object, "title");
    properties.acquisitionMake = title(object, "acquisitionMake");
    properties.acquisitionModel = title(object, "acquisitionModel");
    require(!properties.mediaTypes.empty());
    return properties;
}

FrameSize frameSizeIn(const Json& object) {
    const auto width = whole<int>(object, "frameWidth", frameSides);
    const auto height = whole<int>(object, "frameHeight", frameSides);
    require(width && height);
    return {*width, *height};
}

MediaReaderAnswer answerIn(const Json& object) {
    const auto failure = object.find("failure");
    if (failure == object.end())
        return propertiesIn(object);
    return MediaFailure{text(*failure, longestText), FailureCause::file};
}

ReaderFindings findingsIn(const Json& object) {
    if (object.contains("frameWidth"))
        return frameSizeIn(object);
    return std::visit([](auto&& either) -> ReaderFindings { return std::move(either); }, answerIn(object));
}

// --- Encoding

template <typename Number>
void put(Json& object, const char* key, const std::optional<Number>& number, const Range& range) {
    if (number && range.contains(static_cast<double>(*number)))
        object[key] = *number;
}

void put(Json& object, const char* key, const std::optional<std::string>& title) {
    if (!title)
        return;
    const std::string clean = withoutControlCharacters(beginningOf(*title, longestText));
    if (!clean.empty())
        object[key] = clean;
}

Json beginningOf(const std::vector<std::string>& names) {
    Json list = Json::array();
    for (const std::string& name : names)
        if (list.size() < longestList)
            list.push_back(withoutControlCharacters(beginningOf(name, longestName)));
    return list;
}

Json objectOf(const MediaProperties& properties) {
    Json object{{"mediaTypes", beginningOf(properties.mediaTypes)},
                {"codecs", beginningOf(properties.codecs)}};
    put(object, "pixelWidth", properties.pixelWidth, pixelCounts);
    put(object, "pixelHeight", properties.pixelHeight, pixelCounts);
    put(object, "durationSeconds", properties.durationSeconds, durations);
    put(object, "contentCreationDate", properties.contentCreationDate, dates);
    put(object, "frameRate", properties.frameRate, frameRates);
    put(object, "audioChannelCount", properties.audioChannelCount, channelCounts);
    put(object, "audioSampleRate", properties.audioSampleRate, sampleRates);
    put(object, "totalBitRate", properties.totalBitRate, bitRates);
    put(object, "title", properties.title);
    put(object, "acquisitionMake", properties.acquisitionMake);
    put(object, "acquisitionModel", properties.acquisitionModel);
    return object;
}

Json objectOf(const FrameSize& frame) {
    return {{"frameWidth", frame.width}, {"frameHeight", frame.height}};
}

Json objectOf(const MediaFailure& failure) {
    return {{"failure", beginningOf(failure.reason, longestText)}};
}

template <typename... Kinds>
Json objectOf(const std::variant<Kinds...>& either) {
    return std::visit([](const auto& kind) { return objectOf(kind); }, either);
}

}  // namespace

std::string encodeGreeting(const std::vector<std::string>& confinement) {
    return printed({{"mediaReader", readerProtocolVersion}, {"confinement", beginningOf(confinement)}});
}

std::optional<std::vector<std::string>> decodeGreeting(std::string_view message) {
    return decoded(message, [](const Json& object) {
        require(naturalNumber(object, "mediaReader") == readerProtocolVersion);
        return names(object, "confinement");
    });
}

std::string encodeRequest(const ReaderRequest& request) {
    Json object{
        {"request", request.number}, {"fileSize", request.fileSize}, {"readLimit", request.readLimit}};
    put(object, "longestSide", request.longestSide, frameSides);
    return printed(object);
}

std::optional<ReaderRequest> decodeRequest(std::string_view message) {
    return decoded(message, [](const Json& object) {
        return ReaderRequest{naturalNumber(object, "request"), naturalNumber(object, "fileSize"),
                             naturalNumber(object, "readLimit"),
                             whole<int>(object, "longestSide", frameSides)};
    });
}

std::string encodeReply(const ReaderReply& reply) {
    Json object = objectOf(reply.findings);
    object["request"] = reply.number;
    return printed(object);
}

std::optional<ReaderReply> decodeReply(std::string_view message) {
    return decoded(message, [](const Json& object) {
        return ReaderReply{naturalNumber(object, "request"), findingsIn(object)};
    });
}

bool isReplyTo(const ReaderRequest& request, const ReaderReply& reply) {
    if (reply.number != request.number)
        return false;
    if (std::holds_alternative<MediaFailure>(reply.findings))
        return true;
    const auto* frame = std::get_if<FrameSize>(&reply.findings);
    if (!request.longestSide || !frame)
        return !request.longestSide && !frame;
    return std::max(frame->width, frame->height) <= *request.longestSide;
}

}  // namespace vexo
