#pragma once

#include "contentdb/Query.h"
#include "contentdb/store/ContentStore.h"
#include "contentdb/terms/Terms.h"

#include <functional>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// What the index knows of a condition in one chunk: `sure` ⊆ items that match ⊆ `possible`.
struct Bounds {
    IdSet sure;
    IdSet possible;
};

/// A condition with its terms looked up, to be evaluated chunk by chunk.
class QueryPlan {
  public:
    QueryPlan(ContentStore& store, const Condition& condition);

    /// The condition's bounds among `all` items of the chunk.
    Bounds evaluate(std::int64_t chunk, const IdSet& all) const;

  private:
    enum class Kind { all, any, none, terms };

    void addTerm(const std::string& value, bool isSure = true);
    void addWord(const std::string& word, bool mayContinue);
    void add(const WordsMatch& match);
    void add(const TagMatch& match);
    void add(const NumberMatch& match);
    void add(const TypeMatch& match);
    void add(const TextMatch& match);
    void add(const ExpressionMatch& match);
    void addParts(Kind kind, const std::vector<Condition>& parts);
    void addGroups(const std::string& start, const std::string& end, const NumberMatch& match,
                   const std::function<void(TermId, const NumberGroup&)>& addCut);
    void evaluateParts(std::int64_t chunk, const IdSet& all, Bounds& bounds) const;

    ContentStore& store_;
    Kind kind_ = Kind::terms;
    std::vector<QueryPlan> parts_;
    std::vector<TermId> sureTerms_;
    std::vector<TermId> possibleTerms_;
    bool isEverythingPossible_ = false;
    bool isOnlyPossible_ = false;  // for Kind::all: the parts are necessary but not sufficient
};

}  // namespace qvct::contentdb
