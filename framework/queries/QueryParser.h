// Reads the text of a query; QueryExpression.h describes the language. Recursive descent, a function for each
// rule of it, with a limit to its depth. Used once, by one thread.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "framework/queries/QueryCondition.h"
#include "framework/queries/QueryExpression.h"
#include "framework/queries/QueryScanner.h"

namespace vexo {

class QueryParser {
  public:
    // The text outlives the parser.
    explicit QueryParser(std::string_view text) : scanner_(text) {}

    // nil when the text is no query.
    QueryConditionRef parse();
    // Requires: `parse` has answered nil.
    const QuerySyntaxError& error() const { return *error_; }

  private:
    using Rule = QueryConditionRef (QueryParser::*)();

    // Each takes what its rule describes; nil after an error.
    QueryConditionRef readAlternatives();
    QueryConditionRef readConjunction();
    template <typename Conditions>
    QueryConditionRef readChain(Rule part, std::string_view link);
    QueryConditionRef readNegation();
    QueryConditionRef readNested(Rule rule);
    QueryConditionRef readGroup();
    QueryConditionRef readCondition();
    QueryConditionRef readComparison(std::string key);
    QueryConditionRef readRange();
    std::optional<std::string> readKey();
    std::optional<QueryOperand> readOperandAfter(std::string_view what);
    std::optional<QueryOperand> readText(std::size_t start, char quote);
    std::optional<TextModifiers> readModifiers();
    std::optional<QueryOperand> readTime(std::size_t start);
    std::optional<QueryOperand> readMovingTime(QueryTimeUnit unit);
    std::optional<QueryOperand> readFixedTime();
    bool expect(std::string_view symbol);

    std::nullopt_t fail(std::string message) { return failAt(scanner_.next(), std::move(message)); }
    std::nullopt_t failAt(std::size_t position, std::string message);

    QueryScanner scanner_;
    int depth_ = 0;
    std::optional<QuerySyntaxError> error_;
};

}  // namespace vexo
