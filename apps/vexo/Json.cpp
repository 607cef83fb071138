#include "apps/vexo/Json.h"

#include "framework/GuardedWork.h"
#include "platform/Text.h"

namespace vexo {
namespace {

Json jsonDate(const platform::DateRef& date) {
    return date ? Json(platform::iso8601String(*date)) : Json();
}

Json jsonURL(const std::optional<platform::URL>& url) {
    return url ? Json(url->absoluteString()) : Json();
}

// Points are whole numbers as a rule, and are written so.
Json jsonPoints(double points) {
    const auto whole = static_cast<std::int64_t>(points);
    return static_cast<double>(whole) == points ? Json(whole) : Json(points);
}

// Data has no form in JSON; its size tells it from none.
Json jsonData(const platform::Data& data) {
    return Json{{"bytes", data.size()}};
}

}  // namespace

Json jsonText(const std::optional<std::string>& text) {
    return text ? Json(platform::validUTF8(*text)) : Json();
}

Json jsonValue(const platform::Value& value) {
    if (const bool* boolean = value.boolean())
        return *boolean;
    if (const std::int64_t* integer = value.integer())
        return *integer;
    if (const double* real = value.real())
        return *real;
    if (const std::string* text = value.string())
        return jsonText(*text);
    if (const platform::Size* size = value.size())
        return platform::stringFromSize(*size);
    if (const platform::DateRef date = value.date())
        return jsonDate(date);
    if (const platform::Array* array = value.array()) {
        Json json = Json::array();
        for (const platform::Value& element : *array)
            json.push_back(jsonValue(element));
        return json;
    }
    if (const platform::Dictionary* dictionary = value.dictionary())
        return jsonValues(*dictionary);
    return jsonData(*value.data());
}

Json jsonValues(const platform::Dictionary& values) {
    Json json = Json::object();
    for (const auto& [key, value] : values)
        json[platform::validUTF8(key)] = jsonValue(value);
    return json;
}

Json JsonTreeWriter::groupAlone(const VXMediaGroupRef& group) {
    return {{"id", jsonText(group->ID())},
            {"name", jsonText(group->name())},
            {"type", group->typeIdentifier().text()},
            {"parentID", jsonText(group->parentID())},
            {"path", jsonText(group->path())},
            {"url", jsonURL(group->URL())},
            {"icon", image(group->icon())},
            {"modificationDate", jsonDate(group->modificationDate())},
            {"attributes", jsonValues(*group->attributes())},
            {"noDataMessage", jsonText(noDataMessage(manager_, group))}};
}

Json JsonTreeWriter::mediaGroups() {
    Json groups = Json::array();
    for (const VXMediaGroupRef& group : guardedAnswer([&] { return manager_.mediaGroups(); }))
        groups.push_back(groupAlone(group));
    return groups;
}

Json JsonTreeWriter::group(const VXMediaGroupRef& group, std::optional<int> depth) {
    Json json = groupAlone(group);
    Json& mediaObjects = json["mediaObjects"] = Json::array();
    for (const VXMediaObjectRef& mediaObject : group->mediaObjects())
        mediaObjects.push_back(object(mediaObject));
    Json& childGroups = json["childGroups"] = Json::array();
    if (depth == 0)
        return json;
    const std::optional<int> depthBelow = depth ? std::optional(*depth - 1) : std::nullopt;
    for (const VXMediaGroupRef& child : group->childGroups())
        childGroups.push_back(this->group(child, depthBelow));
    return json;
}

Json JsonTreeWriter::object(const VXMediaObjectRef& mediaObject) {
    Json json{
        {"id", jsonText(mediaObject->ID())},       {"name", jsonText(mediaObject->name())},
        {"path", jsonText(mediaObject->path())},   {"url", jsonURL(mediaObject->URL())},
        {"mediaType", mediaObject->mediaType()},   {"mediaSourceType", mediaObject->mediaSourceType()},
        {"icon", image(mediaObject->icon())},      {"attributes", jsonValues(mediaObject->attributes())},
        {"object", objectNumbers_.of(mediaObject)}};
    if (metadata_ == MetadataOutput::include)
        addMetadata(json, *mediaObject);
    return json;
}

void JsonTreeWriter::addMetadata(Json& json, const VXMediaObject& mediaObject) {
    const VXMetadataPropertiesRef properties = mediaObject.spotlightProperties();
    json["metadata"] = jsonValues(properties ? properties->allValues() : platform::Dictionary{});
    if (const auto duration = mediaObject.attributeForKey(VXMediaObjectDurationKey))
        json["duration"] = jsonValue(*duration);
    if (const auto resolution = mediaObject.attributeForKey(VXMediaObjectResolutionKey))
        json["resolution"] = jsonValue(*resolution);
}

Json JsonTreeWriter::image(const platform::ImageRef& image) {
    if (!image)
        return {};
    return {{"name", image->name().empty() ? Json() : jsonText(image->name())},
            {"width", jsonPoints(image->size().width)},
            {"height", jsonPoints(image->size().height)},
            {"image", imageNumbers_.of(image->weak_from_this())}};
}

std::optional<std::string> noDataMessage(VXMediaManager& manager, const VXMediaGroupRef& group) {
    return guardedAnswer([&] { return manager.defaultNoDataMessage(group); });
}

}  // namespace vexo
