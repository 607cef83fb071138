// The values that attributes, metadata properties, preferences and property lists are made of.
//
// A Value is immutable once made and cheap to copy: texts and containers are shared. Absence is not a value;
// use std::optional<Value>.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

#include "platform/Date.h"

namespace platform {

// Width and height in points or pixels.
struct Size {
    double width = 0;
    double height = 0;
    bool operator==(const Size&) const = default;
};

// The platform's text form of a size: "{1920, 1080}". A fraction is printed with as few digits as tell it
// apart from its neighbours.
std::string stringFromSize(const Size& size);

class Value;
using Array = std::vector<Value>;
using Dictionary = std::map<std::string, Value, std::less<>>;
using Data = std::vector<std::byte>;

class Value {
  public:
    Value(bool boolean) : content_(boolean) {}
    Value(int number) : content_(std::int64_t{number}) {}
    Value(std::int64_t number) : content_(number) {}
    Value(double number) : content_(number) {}
    Value(std::string text) : content_(std::make_shared<const std::string>(std::move(text))) {}
    Value(std::string_view text) : Value(std::string(text)) {}
    Value(const char* text) : Value(std::string(text)) {}
    Value(DateRef date) : content_(std::move(date)) {}  // Requires: date is not nil.
    Value(Size size) : content_(size) {}
    Value(Data data) : content_(std::make_shared<const Data>(std::move(data))) {}
    Value(Array array) : content_(std::make_shared<const Array>(std::move(array))) {}
    Value(Dictionary entries) : content_(std::make_shared<const Dictionary>(std::move(entries))) {}

    // Each answers nil when the value is of another kind. The pointers live as long as any copy of the value.
    const bool* boolean() const { return std::get_if<bool>(&content_); }
    const std::int64_t* integer() const { return std::get_if<std::int64_t>(&content_); }
    const double* real() const { return std::get_if<double>(&content_); }
    const std::string* string() const;
    const Size* size() const { return std::get_if<Size>(&content_); }
    DateRef date() const;
    const Data* data() const;
    const Array* array() const;
    const Dictionary* dictionary() const;

    // The numeric value of a boolean, an integer, a real, or text that begins with a decimal number after
    // whitespace ("0.7abc" is 0.7, other text is 0.0, as the platform converts it); nil for every other kind.
    // Never depends on the locale.
    std::optional<double> doubleValue() const;
    // The whole number of a boolean, an integer or a real, cut off toward zero, or the one that text begins
    // with after whitespace ("7.9" is 7, other text is 0); kept within the type. nil for every other kind.
    std::optional<std::int64_t> intValue() const;
    // The truth of a boolean or a number (not zero), or of text that begins with "y" or "t" in either case
    // (yes, true) or with a number other than zero; nil for every other kind.
    std::optional<bool> boolValue() const;

    // Equal kind and equal content; dates by their time, containers element by element.
    bool operator==(const Value& other) const;

  private:
    std::variant<bool, std::int64_t, double, std::shared_ptr<const std::string>, DateRef, Size,
                 std::shared_ptr<const Data>, std::shared_ptr<const Array>, std::shared_ptr<const Dictionary>>
        content_;
};

// The value under `key`, or nil.
const Value* find(const Dictionary& dictionary, std::string_view key);

}  // namespace platform
