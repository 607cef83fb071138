#include "framework/queries/LiveQueries.h"

#include <algorithm>
#include <chrono>

#include "framework/Diagnostics.h"
#include "framework/HostServices.h"

namespace vexo {

using platform::Locked;

platform::DateRef systemTime() {
    const std::chrono::duration<double> since1970 = std::chrono::system_clock::now().time_since_epoch();
    return platform::Date::since1970(since1970.count());
}

void LiveQueries::watchQuery(const std::string& query, const VXPathObserverRef& observer,
                             VXPathListRef queryScope, unsigned /*queryRunMode*/) {
    const auto result = QueryExpression::parse(query);
    if (const auto* error = std::get_if<QuerySyntaxError>(&result)) {
        hostServices().diagnostics.warn("a query makes no sense: " + error->description() + ": " + query);
        return;
    }
    if (const LiveQueryRef live =
            registered(query, std::get<QueryExpression>(result), observer, std::move(queryScope)))
        live->update({});
}

LiveQueries::LiveQueryRef LiveQueries::registered(const std::string& query, QueryExpression expression,
                                                  const VXPathObserverRef& observer,
                                                  VXPathListRef queryScope) {
    Locked lock(mutex_);
    if (isClosed_)
        return nullptr;
    for (const LiveQueryRef& known : queries_) {
        if (!known->isOf(query, observer))
            continue;
        known->setScope(std::move(queryScope));
        return known;
    }
    auto metadataQuery = std::make_unique<MetadataQuery>(std::move(expression), std::move(queryScope),
                                                         hostServices().metadata);
    queries_.push_back(std::make_shared<LiveQuery>(query, std::move(metadataQuery), observer, surroundings_));
    return queries_.back();
}

void LiveQueries::changed(const std::vector<std::string>& paths) {
    for (const LiveQueryRef& query : livingQueries())
        query->update(paths);
}

std::vector<LiveQueries::LiveQueryRef> LiveQueries::livingQueries() {
    // Freed after the lock is left: what the surroundings hold may do anything when it goes.
    std::vector<LiveQueryRef> forgotten;
    Locked lock(mutex_);
    const auto firstForgotten = std::stable_partition(
        queries_.begin(), queries_.end(), [](const LiveQueryRef& query) { return query->hasObserver(); });
    std::move(firstForgotten, queries_.end(), std::back_inserter(forgotten));
    queries_.erase(firstForgotten, queries_.end());
    for (const LiveQueryRef& query : forgotten)
        query->close();
    return queries_;
}

void LiveQueries::close() {
    std::vector<LiveQueryRef> forgotten;
    Locked lock(mutex_);
    isClosed_ = true;
    forgotten.swap(queries_);
    for (const LiveQueryRef& query : forgotten)
        query->close();
}

}  // namespace vexo
