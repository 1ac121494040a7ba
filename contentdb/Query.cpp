#include "contentdb/Query.h"

#include "contentdb/query/QueryFields.h"
#include "contentdb/query/QueryMatching.h"
#include "contentdb/query/QueryParser.h"
#include "contentdb/terms/Words.h"

#include <algorithm>

namespace qvct::contentdb {
namespace {

/// Negative, 0 or positive; what is missing comes last whatever the direction.
template <typename T>
int compare(const std::vector<T>& a, const std::vector<T>& b, bool isDescending) {
    if (a.empty() || b.empty()) return static_cast<int>(a.empty()) - static_cast<int>(b.empty());
    const T& left = *std::min_element(a.begin(), a.end());
    const T& right = *std::min_element(b.begin(), b.end());
    const int order = left < right ? -1 : right < left ? 1 : 0;
    return isDescending ? -order : order;
}

std::vector<std::string> sortTexts(const IndexedItem& item, const Field& field) {
    const bool isName = field.kind == Field::Kind::name;  // by the file's, whatever its title
    std::vector<std::string> texts = isName ? std::vector{item.name} : textsInField(item, field);
    for (std::string& text : texts) text = folded(text);
    return texts;
}

}  // namespace

std::optional<Query> parseQuery(std::string_view text, const Vocabulary& vocabulary, QueryError* error) {
    try {
        return parsedQuery(text, vocabulary);
    } catch (const QueryFault& fault) {
        if (error != nullptr) *error = fault.error;
        return std::nullopt;
    }
}

bool matches(const Query& query, const IndexedItem& item, Error* error) {
    if (!item.failure.empty() || (query.like && item.likeness.empty())) return false;
    Error fault;
    const bool isMatch = meets(query.condition, item, fault);
    if (!fault.isSet()) return isMatch;
    if (error != nullptr) *error = fault;
    return false;
}

bool comesBefore(const Query& query, const IndexedItem& a, const IndexedItem& b) {
    for (const SortKey& key : query.order) {
        const int order =
            isNumeric(key.field)
                ? compare(numbersInField(a, key.field), numbersInField(b, key.field), key.isDescending)
                : compare(sortTexts(a, key.field), sortTexts(b, key.field), key.isDescending);
        if (order != 0) return order < 0;
    }
    return false;
}

}  // namespace qvct::contentdb
