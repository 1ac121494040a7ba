#include "DatabaseAccess.h"

#include "ToolContext.h"
#include "platform/text/Spelling.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <type_traits>
#include <variant>

#include <fmt/format.h>

namespace qvct::tool {

using namespace contentdb;

namespace {

/// The labels that a query names as tags.
void addLabels(const Condition& condition, std::vector<std::string>& labels) {
    std::visit(
        [&labels](const auto& match) {
            if constexpr (requires { match.parts; }) {
                for (const Condition& part : match.parts) addLabels(part, labels);
            } else if constexpr (std::is_same_v<std::decay_t<decltype(match)>, TagMatch>) {
                labels.push_back(match.label);
            }
        },
        condition.is);
}

/// The tags that were asked for and that nothing has, with what may have been meant.
void noteUnknownTags(const Query& query, ContentDatabase& database, const ToolContext& context) {
    std::vector<std::string> wanted;
    addLabels(query.condition, wanted);
    const auto facets = wanted.empty() ? std::nullopt : database.facets(Query{});
    if (!facets) return;
    std::vector<std::string> known;
    for (const Facet& facet : *facets) known.push_back(facet.label);
    for (const std::string& label : wanted) {
        const std::string_view meant = nearestSpelling(label, known);
        if (!meant.empty() && spellingDistance(meant, label) > 0)
            context.note(
                fmt::format("no tag \"{}\"; did you mean \"{}\"?", printable(label), printable(meant)));
    }
}

}  // namespace

std::unique_ptr<ContentDatabase> openDatabase(const std::string& path, ToolContext& context) {
    Error error;
    auto database = ContentDatabase::open(path, &error);
    if (!database) context.itemFailed(error);
    if (database && database->isBeingIndexed())
        context.note(errorOf(kErrorUnreadable,
                             "a run of `index` is going on; this is what it has stored so far", {path})
                         .message());
    return database;
}

std::optional<Query> queryIn(const std::string& text, ContentDatabase& database, ToolContext& context) {
    Error error;
    const auto vocabulary = database.vocabulary(&error);
    if (!vocabulary) {
        context.itemFailed(error);
        return std::nullopt;
    }
    QueryError fault;
    auto query = parseQuery(text, *vocabulary, &fault);
    if (query) return query;
    const std::string before = printable(std::string_view(text).substr(0, fault.position));
    const std::string marked = printable(std::string_view(text).substr(fault.position, fault.length));
    context.usageFailed(fmt::format("{}\n  {}\n  {}{}", fault.message, printable(text),
                                    std::string(displayWidth(before), ' '),
                                    std::string(std::max<std::size_t>(1, displayWidth(marked)), '^')));
    return std::nullopt;
}

std::optional<std::vector<Found>> searched(const Query& query, std::size_t limit, ContentDatabase& database,
                                           ToolContext& context) {
    Error error;
    auto found = database.search(query, limit, &error);
    if (!found) context.itemFailed(error);
    if (found && found->empty()) noteUnknownTags(query, database, context);
    return found;
}

}  // namespace qvct::tool
