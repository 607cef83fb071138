#include "apps/vexo/DemoArchive.h"

namespace vexo {

using platform::Value;

namespace {

platform::Array references(const std::vector<DemoArchive::Reference>& numbers) {
    platform::Array array;
    for (const DemoArchive::Reference number : numbers)
        array.push_back(DemoArchive::reference(number));
    return array;
}

// A class is archived with its ancestors, so that a reader without it can choose another.
platform::Array classWithAncestors(const std::string& className) {
    if (className.starts_with("NSMutable"))
        return {className, "NS" + className.substr(std::string_view("NSMutable").size()), "NSObject"};
    return {className, "NSObject"};
}

}  // namespace

DemoArchive::DemoArchive() : records_{"$null"} {}

DemoArchive::Reference DemoArchive::reserve() {
    records_.push_back("$null");
    return static_cast<Reference>(records_.size()) - 1;
}

void DemoArchive::set(Reference reference, Value record) {
    records_.at(static_cast<std::size_t>(reference)) = std::move(record);
}

DemoArchive::Reference DemoArchive::add(Value plain) {
    const std::string* text = plain.string();
    const auto known = text ? texts_.find(*text) : texts_.end();
    if (known != texts_.end())
        return known->second;
    const Reference number = reserve();
    if (text)
        texts_.emplace(*text, number);
    set(number, std::move(plain));
    return number;
}

DemoArchive::Reference DemoArchive::addDate(double secondsSinceReferenceDate) {
    return addObject("NSDate", {{"NS.time", secondsSinceReferenceDate}});
}

DemoArchive::Reference DemoArchive::addArray(const std::vector<Reference>& elements) {
    return addObject("NSMutableArray", {{"NS.objects", references(elements)}});
}

DemoArchive::Reference DemoArchive::addDictionary(const Entries& entries) {
    const Reference number = reserve();
    set(number, dictionary(entries));
    return number;
}

DemoArchive::Reference DemoArchive::addObject(const std::string& className, platform::Dictionary fields) {
    const Reference number = reserve();
    set(number, object(className, std::move(fields)));
    return number;
}

Value DemoArchive::dictionary(const Entries& entries) {
    std::vector<Reference> keys;
    std::vector<Reference> values;
    for (const auto& [key, value] : entries) {
        keys.push_back(add(key));
        values.push_back(value);
    }
    return object("NSMutableDictionary", {{"NS.keys", references(keys)}, {"NS.objects", references(values)}});
}

Value DemoArchive::object(const std::string& className, platform::Dictionary fields) {
    fields.emplace("$class", classReference(className));
    return fields;
}

Value DemoArchive::reference(Reference number) {
    return platform::Dictionary{{"CF$UID", number}};
}

Value DemoArchive::classReference(const std::string& className) {
    const auto [known, isNew] = classes_.try_emplace(className, 0);
    if (isNew) {
        known->second = reserve();
        set(known->second,
            platform::Dictionary{{"$classname", className}, {"$classes", classWithAncestors(className)}});
    }
    return reference(known->second);
}

Value DemoArchive::propertyList(Reference root) const {
    return platform::Dictionary{{"$archiver", "NSKeyedArchiver"},
                                {"$version", 100000},
                                {"$top", platform::Dictionary{{"root", reference(root)}}},
                                {"$objects", records_}};
}

}  // namespace vexo
