#include "framework/queries/QueryCondition.h"

#include <algorithm>
#include <compare>

namespace vexo {
namespace {

using platform::Date;
using platform::Value;

// Booleans and dates count as numbers; text does not, even if it looks like one.
std::optional<double> numberOf(const Value& value) {
    if (const platform::DateRef date = value.date())
        return date->secondsSince1970();
    return value.string() ? std::nullopt : value.doubleValue();
}

std::optional<double> numberOf(const QueryOperand& operand, const Date& now) {
    if (const auto* time = std::get_if<QueryTime>(&operand))
        return time->secondsSince1970(now);
    const auto* number = std::get_if<double>(&operand);
    return number ? std::optional(*number) : std::nullopt;
}

// Where the value stands in relation to the operand; nowhere when they are of different kinds.
std::partial_ordering orderOf(const Value& value, const QueryOperand& operand, const Date& now) {
    const auto* pattern = std::get_if<TextPattern>(&operand);
    if (pattern && value.string())
        return pattern->orderOf(*value.string());
    const auto left = numberOf(value);
    const auto right = numberOf(operand, now);
    return left && right ? *left <=> *right : std::partial_ordering::unordered;
}

bool isEqual(const Value& value, const QueryOperand& operand, const Date& now) {
    const auto* pattern = std::get_if<TextPattern>(&operand);
    if (pattern && value.string())
        return pattern->matches(*value.string());
    return orderOf(value, operand, now) == 0;
}

bool compares(const Value& value, QueryOperator comparisonOperator, const QueryOperand& operand,
              const Date& now) {
    switch (comparisonOperator) {
        case QueryOperator::less:
            return orderOf(value, operand, now) < 0;
        case QueryOperator::greater:
            return orderOf(value, operand, now) > 0;
        case QueryOperator::lessOrEqual:
            return orderOf(value, operand, now) <= 0;
        case QueryOperator::greaterOrEqual:
            return orderOf(value, operand, now) >= 0;
        default:
            return isEqual(value, operand, now);
    }
}

template <typename Predicate>
bool anyElement(const Value& value, const Predicate& predicate) {
    if (const platform::Array* elements = value.array())
        return std::any_of(elements->begin(), elements->end(), predicate);
    return predicate(value);
}

// Whether a value of the property, or of any property, is as `predicate` says.
template <typename Predicate>
bool anyValue(const std::string& key, QueriedItem& item, const Predicate& predicate) {
    if (key != anyQueryKey) {
        const auto& value = item.property(key);
        return value && anyElement(*value, predicate);
    }
    const auto& all = item.allProperties();
    return std::any_of(all.begin(), all.end(),
                       [&](const auto& entry) { return anyElement(entry.second, predicate); });
}

bool isPresent(const std::string& key, QueriedItem& item) {
    return key == anyQueryKey ? !item.allProperties().empty() : item.property(key).has_value();
}

bool asksForPresence(QueryOperator comparisonOperator, const QueryOperand& operand) {
    const auto* pattern = std::get_if<TextPattern>(&operand);
    return pattern && pattern->isAnything() &&
           (comparisonOperator == QueryOperator::equal || comparisonOperator == QueryOperator::notEqual);
}

}  // namespace

bool AllConditions::isFulfilledBy(QueriedItem& item) const {
    return std::all_of(conditions_.begin(), conditions_.end(),
                       [&](const auto& condition) { return condition->isFulfilledBy(item); });
}

bool AnyCondition::isFulfilledBy(QueriedItem& item) const {
    return std::any_of(conditions_.begin(), conditions_.end(),
                       [&](const auto& condition) { return condition->isFulfilledBy(item); });
}

bool Comparison::isFulfilledBy(QueriedItem& item) const {
    const bool isSo = asksForPresence(operator_, operand_)
                          ? isPresent(key_, item)
                          : anyValue(key_, item, [&](const Value& value) {
                                return compares(value, operator_, operand_, item.now());
                            });
    return operator_ == QueryOperator::notEqual ? !isSo : isSo;
}

bool RangeCondition::isFulfilledBy(QueriedItem& item) const {
    return anyValue(key_, item, [&](const Value& value) {
        return orderOf(value, lowest_, item.now()) >= 0 && orderOf(value, highest_, item.now()) <= 0;
    });
}

}  // namespace vexo
