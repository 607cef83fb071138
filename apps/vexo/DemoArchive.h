// Builds a keyed archive, the form in which the editor keeps its documents: a list of records that refer to
// each other by number. Only what a sample needs; for reading archives, see platform/KeyedUnarchiver.h.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "platform/Value.h"

namespace vexo {

class DemoArchive {
  public:
    // The number of a record; may be referred to from any number of places, its own record included.
    using Reference = std::int64_t;
    using Entries = std::vector<std::pair<std::string, Reference>>;
    static constexpr Reference nothing = 0;

    DemoArchive();

    // A number for a record that is set later, so that others can refer to it first.
    Reference reserve();
    void set(Reference reference, platform::Value record);

    // Text or a number. Equal texts share one record.
    Reference add(platform::Value plain);
    Reference addDate(double secondsSinceReferenceDate);
    Reference addArray(const std::vector<Reference>& elements);
    Reference addDictionary(const Entries& entries);
    // An object of a class of the editor's own. `fields` are numbers and what `reference` answers.
    Reference addObject(const std::string& className, platform::Dictionary fields);

    // Records, for `set`.
    platform::Value dictionary(const Entries& entries);
    platform::Value object(const std::string& className, platform::Dictionary fields);

    // A field that refers to a record.
    static platform::Value reference(Reference number);

    // The archive whose top object is `root`.
    platform::Value propertyList(Reference root) const;

  private:
    platform::Value classReference(const std::string& className);

    platform::Array records_;
    std::map<std::string, Reference> texts_;
    std::map<std::string, Reference> classes_;
};

}  // namespace vexo
