#include "framework/queries/QueryParser.h"

#include <array>
#include <cmath>

#include "platform/CalendarDate.h"
#include "platform/Text.h"

namespace vexo {
namespace {

struct OperatorName {
    std::string_view text;
    QueryOperator meaning;
};

// A longer one before those that it begins with.
constexpr std::array operatorNames{
    OperatorName{"==", QueryOperator::equal},    OperatorName{"=", QueryOperator::equal},
    OperatorName{"!=", QueryOperator::notEqual}, OperatorName{"<=", QueryOperator::lessOrEqual},
    OperatorName{"<", QueryOperator::less},      OperatorName{">=", QueryOperator::greaterOrEqual},
    OperatorName{">", QueryOperator::greater},
};

struct TimeName {
    std::string_view text;
    QueryTimeUnit unit;
};

constexpr std::array timeNames{
    TimeName{"time.now", QueryTimeUnit::now},
    TimeName{"time.today", QueryTimeUnit::today},
    TimeName{"time.yesterday", QueryTimeUnit::yesterday},
    TimeName{"time.this_week", QueryTimeUnit::thisWeek},
    TimeName{"time.this_month", QueryTimeUnit::thisMonth},
    TimeName{"time.this_year", QueryTimeUnit::thisYear},
    TimeName{"time.iso", QueryTimeUnit::fixed},
};

std::optional<bool> truthNamed(std::string_view word) {
    const auto is = [word](std::string_view name) {
        return platform::caseInsensitiveCompare(word, name) == platform::ComparisonResult::same;
    };
    if (is("true") || is("YES"))
        return true;
    if (is("false") || is("NO"))
        return false;
    return std::nullopt;
}

std::string quoted(std::string_view text) {
    return "'" + std::string(text) + "'";
}

}  // namespace

std::nullopt_t QueryParser::failAt(std::size_t position, std::string message) {
    error_ = QuerySyntaxError{std::move(message), position};
    return std::nullopt;
}

bool QueryParser::expect(std::string_view symbol) {
    if (scanner_.take(symbol))
        return true;
    fail("expected " + quoted(symbol));
    return false;
}

QueryConditionRef QueryParser::parse() {
    QueryConditionRef condition = readAlternatives();
    if (condition && !scanner_.isAtEnd())
        fail("expected '&&', '||' or the end of the query");
    return error_ ? nullptr : std::move(condition);
}

QueryConditionRef QueryParser::readAlternatives() {
    return readChain<AnyCondition>(&QueryParser::readConjunction, "||");
}

QueryConditionRef QueryParser::readConjunction() {
    return readChain<AllConditions>(&QueryParser::readNegation, "&&");
}

template <typename Conditions>
QueryConditionRef QueryParser::readChain(Rule part, std::string_view link) {
    std::vector<QueryConditionRef> conditions;
    do {
        QueryConditionRef condition = (this->*part)();
        if (!condition)
            return nullptr;
        conditions.push_back(std::move(condition));
    } while (scanner_.take(link));
    if (conditions.size() == 1)
        return std::move(conditions.front());
    return std::make_unique<Conditions>(std::move(conditions));
}

QueryConditionRef QueryParser::readNegation() {
    if (scanner_.take("!")) {
        QueryConditionRef condition = readNested(&QueryParser::readNegation);
        return condition ? std::make_unique<OppositeCondition>(std::move(condition)) : nullptr;
    }
    return scanner_.take("(") ? readNested(&QueryParser::readGroup) : readCondition();
}

QueryConditionRef QueryParser::readNested(Rule rule) {
    if (depth_ == QueryExpression::deepestQuery) {
        fail("more than " + std::to_string(QueryExpression::deepestQuery) + " levels of '(' and '!'");
        return nullptr;
    }
    ++depth_;
    QueryConditionRef condition = (this->*rule)();
    --depth_;
    return condition;
}

QueryConditionRef QueryParser::readGroup() {
    QueryConditionRef condition = readAlternatives();
    if (!condition || scanner_.take(")"))
        return condition;
    fail("expected '&&', '||' or ')'");
    return nullptr;
}

QueryConditionRef QueryParser::readCondition() {
    std::optional<std::string> key = readKey();
    if (!key)
        return nullptr;
    return key == "InRange" && scanner_.take("(") ? readRange() : readComparison(std::move(*key));
}

QueryConditionRef QueryParser::readComparison(std::string key) {
    for (const OperatorName& name : operatorNames) {
        if (!scanner_.take(name.text))
            continue;
        auto operand = readOperandAfter(name.text);
        if (!operand)
            return nullptr;
        return std::make_unique<Comparison>(std::move(key), name.meaning, std::move(*operand));
    }
    fail("expected an operator after " + quoted(key));
    return nullptr;
}

QueryConditionRef QueryParser::readRange() {
    auto key = readKey();
    if (!key || !expect(","))
        return nullptr;
    auto lowest = readOperandAfter(",");
    if (!lowest || !expect(","))
        return nullptr;
    auto highest = readOperandAfter(",");
    if (!highest || !expect(")"))
        return nullptr;
    return std::make_unique<RangeCondition>(std::move(*key), std::move(*lowest), std::move(*highest));
}

std::optional<std::string> QueryParser::readKey() {
    if (scanner_.take(anyQueryKey))
        return std::string(anyQueryKey);
    const std::string_view word = scanner_.takeWord();
    return word.empty() ? fail("expected the name of a property") : std::optional(std::string(word));
}

std::optional<QueryOperand> QueryParser::readOperandAfter(std::string_view what) {
    const std::size_t start = scanner_.next();
    for (const char quote : {'\'', '"'}) {
        if (scanner_.take({&quote, 1}))
            return readText(start, quote);
    }
    if (scanner_.take("$"))
        return readTime(start);
    if (const auto number = scanner_.takeNumber())
        return std::isinf(*number) ? failAt(start, "a number out of range")
                                   : std::optional<QueryOperand>(*number);
    if (const auto truth = truthNamed(scanner_.takeWord()))
        return *truth ? 1.0 : 0.0;
    return failAt(start, "expected a value after " + quoted(what));
}

std::optional<QueryOperand> QueryParser::readText(std::size_t start, char quote) {
    TextPattern::Pieces pieces{""};
    for (;;) {
        const auto character = scanner_.takeCharacter();
        if (!character)
            return failAt(start, "a text without a closing " + std::string(1, quote));
        if (!character->isEscaped && character->byte == quote)
            break;
        if (!character->isEscaped && character->byte == '*')
            pieces.emplace_back();
        else
            pieces.back() += character->byte;
    }
    const auto modifiers = readModifiers();
    return modifiers ? std::optional<QueryOperand>(TextPattern(pieces, *modifiers)) : std::nullopt;
}

std::optional<TextModifiers> QueryParser::readModifiers() {
    TextModifiers modifiers;
    while (const auto letter = scanner_.takeAdjacentLetter()) {
        if (*letter == 'c')
            modifiers.ignoresCase = true;
        else if (*letter == 'd')
            modifiers.ignoresDiacritics = true;
        else if (*letter == 'w')
            modifiers.comparesWords = true;
        else
            return failAt(scanner_.position() - 1, "unknown modifier " + quoted({&*letter, 1}));
    }
    return modifiers;
}

std::optional<QueryOperand> QueryParser::readTime(std::size_t start) {
    const std::string_view word = scanner_.takeWord();
    for (const TimeName& name : timeNames) {
        if (name.text == word)
            return name.unit == QueryTimeUnit::fixed ? readFixedTime() : readMovingTime(name.unit);
    }
    return failAt(start, "unknown time '$" + std::string(word) + "'");
}

std::optional<QueryOperand> QueryParser::readMovingTime(QueryTimeUnit unit) {
    if (!scanner_.take("("))
        return QueryTime{unit, 0};
    const std::size_t start = scanner_.next();
    const double amount = scanner_.takeNumber().value_or(NAN);
    const bool isWhole = std::trunc(amount) == amount && std::abs(amount) <= QueryTime::mostUnits;
    if (!(unit == QueryTimeUnit::now ? std::isfinite(amount) : isWhole))
        return failAt(start, unit == QueryTimeUnit::now ? "expected a number" : "expected a whole number");
    return expect(")") ? std::optional<QueryOperand>(QueryTime{unit, amount}) : std::nullopt;
}

std::optional<QueryOperand> QueryParser::readFixedTime() {
    if (!expect("("))
        return std::nullopt;
    const std::size_t start = scanner_.next();
    const std::string_view text = scanner_.takeUntil(')').value_or("");
    for (const char* format : {"%Y-%m-%dT%H:%M:%S%z", "%Y-%m-%dT%H:%M:%S", "%Y-%m-%d"}) {
        if (const auto date = platform::CalendarDate::dateWithString(text, format))
            return QueryTime{QueryTimeUnit::fixed, date->secondsSince1970()};
    }
    return failAt(start, "expected a date such as 2008-12-31T23:59:59Z");
}

}  // namespace vexo
