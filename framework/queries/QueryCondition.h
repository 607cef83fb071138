// What a query is made of once it is read: conditions that an item fulfils or not. Immutable, so one tree of
// them serves several threads. The rules of comparing are in QueryExpression.h.
#pragma once

#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "framework/queries/QueriedItem.h"
#include "framework/queries/QueryTime.h"
#include "framework/queries/TextPattern.h"

namespace vexo {

class QueryCondition {
  public:
    virtual ~QueryCondition() = default;
    // Asks for no property that the answer does not depend on, in the order of the query's text.
    virtual bool isFulfilledBy(QueriedItem& item) const = 0;
};
using QueryConditionRef = std::unique_ptr<const QueryCondition>;

class AllConditions final : public QueryCondition {
  public:
    explicit AllConditions(std::vector<QueryConditionRef> conditions) : conditions_(std::move(conditions)) {}
    bool isFulfilledBy(QueriedItem& item) const override;

  private:
    const std::vector<QueryConditionRef> conditions_;
};

class AnyCondition final : public QueryCondition {
  public:
    explicit AnyCondition(std::vector<QueryConditionRef> conditions) : conditions_(std::move(conditions)) {}
    bool isFulfilledBy(QueriedItem& item) const override;

  private:
    const std::vector<QueryConditionRef> conditions_;
};

class OppositeCondition final : public QueryCondition {
  public:
    explicit OppositeCondition(QueryConditionRef condition) : condition_(std::move(condition)) {}
    bool isFulfilledBy(QueriedItem& item) const override { return !condition_->isFulfilledBy(item); }

  private:
    const QueryConditionRef condition_;
};

enum class QueryOperator { equal, notEqual, less, greater, lessOrEqual, greaterOrEqual };

// What a property is compared with; a truth value is the number 1 or 0.
using QueryOperand = std::variant<TextPattern, double, QueryTime>;

inline constexpr std::string_view anyQueryKey = "*";

class Comparison final : public QueryCondition {
  public:
    Comparison(std::string key, QueryOperator comparisonOperator, QueryOperand operand)
        : key_(std::move(key)), operator_(comparisonOperator), operand_(std::move(operand)) {}
    bool isFulfilledBy(QueriedItem& item) const override;

  private:
    const std::string key_;
    const QueryOperator operator_;
    const QueryOperand operand_;
};

// Whether one value of a property is neither below the lowest nor above the highest.
class RangeCondition final : public QueryCondition {
  public:
    RangeCondition(std::string key, QueryOperand lowest, QueryOperand highest)
        : key_(std::move(key)), lowest_(std::move(lowest)), highest_(std::move(highest)) {}
    bool isFulfilledBy(QueriedItem& item) const override;

  private:
    const std::string key_;
    const QueryOperand lowest_;
    const QueryOperand highest_;
};

}  // namespace vexo
