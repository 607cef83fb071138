#include "framework/queries/QueryExpression.h"

#include "framework/queries/QueryParser.h"

namespace vexo {

std::string QuerySyntaxError::description() const {
    return message + " at position " + std::to_string(position);
}

QueryExpression::Result QueryExpression::parse(std::string_view text) {
    if (text.size() > longestQuery)
        return QuerySyntaxError{"the query is longer than " + std::to_string(longestQuery) + " bytes",
                                longestQuery};
    QueryParser parser(text);
    if (QueryConditionRef condition = parser.parse())
        return QueryExpression(std::move(condition));
    return parser.error();
}

QueryExpression::QueryExpression(std::shared_ptr<const QueryCondition> condition)
    : condition_(std::move(condition)) {}

bool QueryExpression::matches(const VXMetadataProperties& properties, const platform::Date& now) const {
    QueriedItem item(properties, now);
    return condition_->isFulfilledBy(item);
}

}  // namespace vexo
