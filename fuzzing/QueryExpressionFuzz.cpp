// Queries over made-up properties: whatever the text, an error lies within it, and a query with its opposite
// and with itself means what logic says. The input is the query, a NUL, and the text of a property.
#include <cstdint>
#include <string>

#include "framework/queries/QueryExpression.h"
#include "fuzzing/Require.h"

namespace {

using vexo::QueryExpression;
using vexo::QuerySyntaxError;

// One property of each kind, by the first letter of its key.
class MadeUpProperties final : public vexo::VXMetadataProperties {
  public:
    explicit MadeUpProperties(std::string_view text)
        : values_{{"a", platform::Array{text, 5, true}},
                  {"b", true},
                  {"d", platform::Date::since1970(1e9)},
                  {"n", 640},
                  {"r", 29.97},
                  {"s", platform::Size{4, 3}},
                  {"t", text}} {}

    std::optional<platform::Value> valueForKey(std::string_view key) const override {
        const platform::Value* value = platform::find(values_, key.substr(0, 1));
        return value ? std::optional(*value) : std::nullopt;
    }
    platform::Dictionary allValues() const override { return values_; }

  private:
    const platform::Dictionary values_;
};

// False as well for what is no query, or is one too long or too deep.
bool matches(const std::string& query, const MadeUpProperties& properties) {
    const auto result = QueryExpression::parse(query);
    const auto* expression = std::get_if<QueryExpression>(&result);
    return expression && expression->matches(properties, platform::Date(250000000));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view input(reinterpret_cast<const char*>(data), size);
    const std::string query(input.substr(0, input.find('\0')));
    const MadeUpProperties properties(input.substr(std::min(query.size() + 1, size)));

    const auto result = QueryExpression::parse(query);
    if (const auto* error = std::get_if<QuerySyntaxError>(&result)) {
        require(error->position <= query.size() && !error->message.empty());
        return 0;
    }
    const std::string whole = "(" + query + ")";
    if (!std::holds_alternative<QueryExpression>(QueryExpression::parse("!" + whole + "&&" + whole)))
        return 0;
    const bool isMeant = matches(query, properties);
    require(matches("!" + whole, properties) != isMeant);
    require(matches(whole + "&&" + whole, properties) == isMeant);
    require(matches(whole + "||!" + whole, properties));
    return 0;
}
