// The values of trees as JSON. Field names and forms are a contract with scripts: fields may be added, none
// may change or go.
#pragma once

#include <map>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>

#include "host/VXMediaManager.h"

namespace vexo {

using Json = nlohmann::ordered_json;

// Bytes that are not UTF-8 appear as U+FFFD; nil is null.
Json jsonText(const std::optional<std::string>& text);
Json jsonValue(const platform::Value& value);
Json jsonValues(const platform::Dictionary& values);

enum class MetadataOutput { leaveOut, include };

// Writes the groups of one run. Numbers objects and images by identity: the same number for the same object.
class JsonTreeWriter {
  public:
    JsonTreeWriter(VXMediaManager& manager, MetadataOutput metadata)
        : manager_(manager), metadata_(metadata) {}

    // The group with everything below it, `depth` levels of groups deep; nil for all.
    Json group(const VXMediaGroupRef& group, std::optional<int> depth);
    // The group without its items and children.
    Json groupAlone(const VXMediaGroupRef& group);

  private:
    Json object(const VXMediaObjectRef& mediaObject);
    Json image(const platform::ImageRef& image);
    void addMetadata(Json& json, const VXMediaObject& mediaObject);

    // Numbers things by their address, which stays theirs because they are kept.
    template <typename T>
    class Numbers {
      public:
        int of(const std::shared_ptr<T>& thing) {
            return numbers_.emplace(thing, static_cast<int>(numbers_.size()) + 1).first->second;
        }

      private:
        std::map<std::shared_ptr<T>, int> numbers_;
    };

    VXMediaManager& manager_;
    const MetadataOutput metadata_;
    Numbers<VXMediaObject> objectNumbers_;
    Numbers<platform::Image> imageNumbers_;
};

// What the plug-in has to say where a group is empty; nil for nothing. Never raises: a project's broken
// document leaves its message out.
std::optional<std::string> noDataMessage(VXMediaManager& manager, const VXMediaGroupRef& group);

}  // namespace vexo
