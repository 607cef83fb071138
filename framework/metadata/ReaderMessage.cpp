#include "framework/metadata/ReaderMessage.h"

#include <cmath>
#include <nlohmann/json.hpp>

namespace vexo {

namespace {

using Json = nlohmann::json;

// So chosen that whatever is decoded fits into a message again.
constexpr std::size_t longestList = 16;
constexpr std::size_t longestName = 48;
constexpr std::size_t longestReason = 300;  // three times that once bad bytes have become U+FFFD
constexpr int largestPixelCount = 1'000'000;
constexpr double longestDuration = 1e9;  // some thirty years
constexpr double farthestDate = 2.5e11;  // seconds to the year 9999, either way

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

std::uint64_t naturalNumber(const Json& object, const char* key) {
    const auto found = object.find(key);
    require(found != object.end() && found->is_number_unsigned());
    return found->get<std::uint64_t>();
}

std::optional<double> real(const Json& object, const char* key, double least, double greatest) {
    const auto found = object.find(key);
    if (found == object.end())
        return std::nullopt;
    require(found->is_number());
    const double number = found->get<double>();
    require(std::isfinite(number) && number >= least && number <= greatest);
    return number;
}

std::optional<int> pixelCount(const Json& object, const char* key) {
    const auto found = object.find(key);
    if (found == object.end())
        return std::nullopt;
    require(found->is_number_unsigned());
    const auto count = found->get<std::uint64_t>();
    require(count >= 1 && count <= largestPixelCount);
    return static_cast<int>(count);
}

std::string text(const Json& json, std::size_t longest) {
    require(json.is_string() && json.get_ref<const std::string&>().size() <= longest);
    return json.get<std::string>();
}

std::vector<std::string> names(const Json& object, const char* key) {
    const auto found = object.find(key);
    if (found == object.end())
        return {};
    require(found->is_array() && found->size() <= longestList);
    std::vector<std::string> list;
    for (const Json& entry : *found)
        list.push_back(text(entry, longestName));
    return list;
}

MediaProperties propertiesIn(const Json& object) {
    MediaProperties properties;
    properties.mediaTypes = names(object, "mediaTypes");
    properties.pixelWidth = pixelCount(object, "pixelWidth");
    properties.pixelHeight = pixelCount(object, "pixelHeight");
    properties.durationSeconds = real(object, "durationSeconds", 0, longestDuration);
    properties.codecs = names(object, "codecs");
    properties.contentCreationDate = real(object, "contentCreationDate", -farthestDate, farthestDate);
    require(!properties.mediaTypes.empty());
    return properties;
}

MediaReaderAnswer answerIn(const Json& object) {
    const auto failure = object.find("failure");
    if (failure == object.end())
        return propertiesIn(object);
    return MediaFailure{text(*failure, 3 * longestReason), FailureCause::file};
}

template <typename Number>
void put(Json& object, const char* key, const std::optional<Number>& number) {
    if (number)
        object[key] = *number;
}

Json beginningOf(const std::vector<std::string>& names) {
    Json list = Json::array();
    for (const std::string& name : names)
        if (list.size() < longestList)
            list.push_back(name.substr(0, longestName));
    return list;
}

Json objectOf(const MediaProperties& properties) {
    Json object{{"mediaTypes", beginningOf(properties.mediaTypes)},
                {"codecs", beginningOf(properties.codecs)}};
    put(object, "pixelWidth", properties.pixelWidth);
    put(object, "pixelHeight", properties.pixelHeight);
    put(object, "durationSeconds", properties.durationSeconds);
    put(object, "contentCreationDate", properties.contentCreationDate);
    return object;
}

Json objectOf(const MediaFailure& failure) {
    return {{"failure", failure.reason.substr(0, longestReason)}};
}

Json objectOf(const MediaReaderAnswer& answer) {
    return std::visit([](const auto& either) { return objectOf(either); }, answer);
}

}  // namespace

std::string encodeGreeting() {
    return printed({{"mediaReader", readerProtocolVersion}});
}

bool isGreeting(std::string_view message) {
    const auto version =
        decoded(message, [](const Json& object) { return naturalNumber(object, "mediaReader"); });
    return version == readerProtocolVersion;
}

std::string encodeRequest(const ReaderRequest& request) {
    return printed({{"request", request.number}, {"readLimit", request.readLimit}});
}

std::optional<ReaderRequest> decodeRequest(std::string_view message) {
    return decoded(message, [](const Json& object) {
        return ReaderRequest{naturalNumber(object, "request"), naturalNumber(object, "readLimit")};
    });
}

std::string encodeReply(const ReaderReply& reply) {
    Json object = objectOf(reply.answer);
    object["request"] = reply.number;
    return printed(object);
}

std::optional<ReaderReply> decodeReply(std::string_view message) {
    return decoded(message, [](const Json& object) {
        return ReaderReply{naturalNumber(object, "request"), answerIn(object)};
    });
}

std::string encodeAnswer(const MediaReaderAnswer& answer) {
    return printed(objectOf(answer));
}

std::optional<MediaReaderAnswer> decodeAnswer(std::string_view text) {
    return decoded(text, [](const Json& object) { return answerIn(object); });
}

}  // namespace vexo
