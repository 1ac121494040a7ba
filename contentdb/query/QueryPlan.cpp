#include "contentdb/query/QueryPlan.h"

#include "contentdb/terms/Terms.h"
#include "contentdb/terms/Words.h"

namespace qvct::contentdb {
namespace {

/// A key that sorts after every text that begins with `start`: UTF-8 has no byte this high.
std::string behind(std::string_view start) {
    return std::string(start) + '\xff';
}

}  // namespace

QueryPlan::QueryPlan(ContentStore& store, const Condition& condition) : store_(store) {
    std::visit(
        [this](const auto& match) {
            using Match = std::decay_t<decltype(match)>;
            if constexpr (std::is_same_v<Match, AllOf>) {
                addParts(Kind::all, match.parts);
            } else if constexpr (std::is_same_v<Match, AnyOf>) {
                addParts(Kind::any, match.parts);
            } else if constexpr (std::is_same_v<Match, NoneOf>) {
                addParts(Kind::none, match.parts);
            } else {
                add(match);
            }
        },
        condition.is);
}

void QueryPlan::addParts(Kind kind, const std::vector<Condition>& parts) {
    kind_ = kind;
    for (const Condition& part : parts) parts_.emplace_back(store_, part);
}

void QueryPlan::addTerm(const std::string& value, bool isSure) {
    if (const auto id = store_.term(value)) (isSure ? sureTerms_ : possibleTerms_).push_back(*id);
}

void QueryPlan::addWord(const std::string& word, bool mayContinue) {
    if (!mayContinue) return addTerm(term(TermKind::word, word));
    if (wordPrefix(word, kLongestPrefixTerm).size() == word.size())
        return addTerm(term(TermKind::prefix, word));
    const std::string start = term(TermKind::word, word);
    store_.forEachTerm(start, behind(start),
                       [this](TermId id, std::string_view /*value*/) { sureTerms_.push_back(id); });
}

void QueryPlan::add(const WordsMatch& match) {
    isEverythingPossible_ = match.words.empty();
    if (match.words.size() == 1) return addWord(match.words[0], match.lastMayContinue);
    if (match.words.empty()) return;
    // The index knows that the words occur, but not that they stand together.
    kind_ = Kind::all;
    isOnlyPossible_ = true;
    for (std::size_t i = 0; i < match.words.size(); ++i) {
        const bool mayContinue = match.lastMayContinue && i + 1 == match.words.size();
        parts_.emplace_back(store_, Condition{WordsMatch{{match.words[i]}, mayContinue, {}}});
    }
}

void QueryPlan::add(const TagMatch& match) {
    if (!match.category.empty()) return addTerm(tagTerm(match.label, match.category));
    const std::string start = tagTerm(match.label, {});
    store_.forEachTerm(start, behind(start),
                       [this](TermId id, std::string_view /*value*/) { sureTerms_.push_back(id); });
}

void QueryPlan::add(const NumberMatch& match) {
    const std::string start = term(TermKind::coarseNumber, match.field) + '\0';
    std::vector<NumberGroup> cut;  // by an end of the range
    addGroups(start, start + "\xff\xff\xff\xff\xff", match,
              [&cut](TermId /*id*/, const NumberGroup& group) { cut.push_back(group); });
    for (const NumberGroup& group : cut) {
        addGroups(fineGroup(match.field, group.first).term, fineGroup(match.field, group.last).term + '\0',
                  match, [this](TermId id, const NumberGroup& /*group*/) { possibleTerms_.push_back(id); });
    }
}

/// Groups inside the range match for sure; `addCut` is called for each that an end of the range cuts.
void QueryPlan::addGroups(const std::string& start, const std::string& end, const NumberMatch& match,
                          const std::function<void(TermId, const NumberGroup&)>& addCut) {
    store_.forEachTerm(start, end, [&](TermId id, std::string_view value) {
        const NumberGroup group = numberGroupOfTerm(value);
        if (match.contains(group.first) && match.contains(group.last)) {
            sureTerms_.push_back(id);
        } else if (group.last >= match.low && group.first <= match.high) {
            addCut(id, group);
        }
    });
}

void QueryPlan::add(const TypeMatch& match) {
    addTerm(typeTerm(match.type));
}

void QueryPlan::add(const TextMatch& match) {
    if (match.field.kind == Field::Kind::pack) return addTerm(term(TermKind::pack, match.text));
    isEverythingPossible_ = true;
}

void QueryPlan::add(const ExpressionMatch& /*match*/) {
    isEverythingPossible_ = true;
}

Bounds QueryPlan::evaluate(std::int64_t chunk, const IdSet& all) const {
    Bounds bounds;
    if (kind_ != Kind::terms) {
        evaluateParts(chunk, all, bounds);
        return bounds;
    }
    for (const TermId id : sureTerms_) store_.addPosting(id, chunk, bounds.sure);
    bounds.possible = isEverythingPossible_ ? all : bounds.sure;
    for (const TermId id : possibleTerms_) store_.addPosting(id, chunk, bounds.possible);
    return bounds;
}

void QueryPlan::evaluateParts(std::int64_t chunk, const IdSet& all, Bounds& bounds) const {
    if (kind_ == Kind::all) bounds = {all, all};
    for (const QueryPlan& part : parts_) {
        const Bounds its = part.evaluate(chunk, all);
        if (kind_ == Kind::all) {
            bounds.sure &= its.sure;
            bounds.possible &= its.possible;
            if (bounds.possible.empty()) return;
        } else {
            bounds.sure |= its.sure;
            bounds.possible |= its.possible;
        }
    }
    if (isOnlyPossible_) bounds.sure.clear();
    if (kind_ != Kind::none) return;
    Bounds inverse{all, all};
    inverse.sure -= bounds.possible;
    inverse.possible -= bounds.sure;
    bounds = inverse;
}

}  // namespace qvct::contentdb
