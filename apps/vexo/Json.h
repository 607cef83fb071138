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

// Writes the groups of one run. Numbers objects and images by identity: the same number for the same object,
// for as long as that lives.
class JsonTreeWriter {
  public:
    JsonTreeWriter(VXMediaManager& manager, MetadataOutput metadata)
        : manager_(manager), metadata_(metadata) {}

    // The group with everything below it, `depth` levels of groups deep; nil for all.
    Json group(const VXMediaGroupRef& group, std::optional<int> depth);
    // The group without its items and children.
    Json groupAlone(const VXMediaGroupRef& group);
    // `mediaGroups` of the plug-in, each without its items and children.
    Json mediaGroups();

  private:
    Json object(const VXMediaObjectRef& mediaObject);
    Json image(const platform::ImageRef& image);
    void addMetadata(Json& json, const VXMediaObject& mediaObject);

    // No number is given twice. A thing that is gone is remembered until the next ones are numbered by the
    // thousand, so that a program that runs for weeks does not collect them.
    template <typename T>
    class Numbers {
      public:
        int of(const std::weak_ptr<T>& thing) {
            if (numbers_.size() >= 2 * living_)
                forgetGone();
            const auto [entry, isNew] = numbers_.try_emplace(thing, last_ + 1);
            last_ += isNew ? 1 : 0;
            return entry->second;
        }

      private:
        void forgetGone() {
            std::erase_if(numbers_, [](const auto& entry) { return entry.first.expired(); });
            living_ = std::max<std::size_t>(numbers_.size(), 1000);
        }

        std::map<std::weak_ptr<T>, int, std::owner_less<>> numbers_;
        int last_ = 0;
        std::size_t living_ = 1000;  // at the last look, or the least that is worth one
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
