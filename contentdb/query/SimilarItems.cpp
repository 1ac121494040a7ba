#include "contentdb/query/SimilarItems.h"

#include "contentdb/query/QueryFields.h"
#include "contentdb/terms/Terms.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <map>
#include <set>
#include <utility>

namespace qvct::contentdb {
namespace {

/// The numbers that are compared, and the distance at which two of them count as half alike.
struct Measure {
    const char* field;
    bool isOfLevel;
    bool isRatio;  // counted in octaves
    double half;
};
constexpr std::array<Measure, 3> kMeasures = {{{"Rhythmic Density", true, false, 0.2},
                                               {"Rhythmic Complexity", true, false, 0.2},
                                               {"tempo", false, true, 0.1375}}};  // ten percent

std::string fieldOf(const Measure& measure) {
    return measure.isOfLevel ? levelField(measure.field) : measure.field;
}

/// What an item is compared by.
struct Facts {
    std::set<std::string> tags;  // and those above them, as terms
    std::set<std::string> key;   // of these
    std::array<std::optional<double>, kMeasures.size()> numbers;

    bool isEmpty() const {
        return tags.empty() &&
               std::none_of(numbers.begin(), numbers.end(), [](const auto& number) { return number; });
    }
};

Facts factsOf(const IndexedItem& item) {
    Facts facts;
    for (const IndexedTagging& tagging : item.taggings) {
        facts.tags.insert(tagTerm(tagging.label, tagging.category));
        for (const std::string& ancestor : tagging.ancestors)
            facts.tags.insert(tagTerm(ancestor, tagging.category));
    }
    for (const std::string& key : keyTerms()) {
        if (facts.tags.contains(key)) facts.key.insert(key);
    }
    const auto numbers = numbersOf(item);
    for (std::size_t i = 0; i < kMeasures.size(); ++i) {
        const auto hit = std::find_if(numbers.begin(), numbers.end(), [&](const auto& number) {
            return number.first == fieldOf(kMeasures[i]) && (!kMeasures[i].isRatio || number.second > 0);
        });
        if (hit != numbers.end()) facts.numbers[i] = hit->second;
    }
    return facts;
}

/// 1 when they are equal, 1/2 at the distance `half`.
double closeness(const Measure& measure, double a, double b) {
    const double distance = measure.isRatio ? std::log2(a) - std::log2(b) : a - b;
    return 1 / (1 + std::abs(distance) / measure.half);
}

/// How close two items count as where one lacks the fact.
constexpr double kUnknown = -1;
using Closenesses = std::array<double, kMeasures.size()>;
constexpr Closenesses kAllUnknown = {kUnknown, kUnknown, kUnknown};

/// How alike two items are in each respect, from 0 to 1.
struct Likeness {
    double tags = kUnknown;
    double key = kUnknown;
    Closenesses numbers = kAllUnknown;

    /// Tags weigh half, rhythm, tempo and key the rest. Unknown facts neither speak for an item nor against
    /// it.
    double mean() const {
        double sum = 0;
        double weights = 0;
        const auto add = [&](double closeness, double weight) {
            if (closeness < 0) return;
            sum += closeness * weight;
            weights += weight;
        };
        constexpr double weightOfTags = 4;
        add(tags, weightOfTags);
        for (const double number : numbers) add(number, 1);
        add(key, 1);
        return weights > 0 ? sum / weights : 0;
    }
};

/// The tags of an item, each weighed by how much it tells: a tag that few items have tells more.
class WeighedTags {
  public:
    WeighedTags(ContentStore& store, const Facts& facts, std::int64_t lastChunk) {
        const auto countOf = [&](const std::string& value) {
            double count = 0;
            const auto id = store.term(value);
            for (std::int64_t chunk = 0; id && chunk <= lastChunk; ++chunk) {
                IdSet ids;
                store.addPosting(*id, chunk, ids);
                count += ids.count();
            }
            return std::max(count, 1.0);
        };
        const double items = countOf(term(TermKind::everything));
        for (const std::string& tag : facts.tags) all_ += weights_[tag] = std::log2(1 + items / countOf(tag));
    }

    double weight(std::string_view tag) const {
        const auto hit = weights_.find(tag);
        return hit == weights_.end() ? 0 : hit->second;
    }
    /// How alike the tags of another item are, which has `tagsOfOther` of them: `shared` is the weight of
    /// those that both items have.
    double likeness(double shared, std::size_t tagsOfOther) const {
        if (weights_.empty()) return kUnknown;
        const double meanWeight = all_ / static_cast<double>(weights_.size());
        // Each further tag of the other item counts as the average weight of this item's tags.
        const double beyond = std::max(0.0, static_cast<double>(tagsOfOther) - shared / meanWeight);
        return std::min(1.0, shared / (all_ + beyond * meanWeight));
    }

  private:
    std::map<std::string, double, std::less<>> weights_;
    double all_ = 0;
};

Likeness likeness(const Facts& item, const WeighedTags& tags, const Facts& other) {
    Likeness result;
    double shared = 0;
    for (const std::string& tag : other.tags) shared += tags.weight(tag);
    result.tags = tags.likeness(shared, other.tags.size());
    if (!item.key.empty() && !other.key.empty()) result.key = item.key == other.key ? 1 : 0;
    for (std::size_t i = 0; i < kMeasures.size(); ++i) {
        if (item.numbers[i] && other.numbers[i])
            result.numbers[i] = closeness(kMeasures[i], *item.numbers[i], *other.numbers[i]);
    }
    return result;
}

/// How alike items can be at most, from the index alone: it knows their tags and keys exactly, and of each
/// number the group that it lies in, whose nearest value is taken.
class LikenessIndex {
  public:
    LikenessIndex(ContentStore& store, const Facts& item, const WeighedTags& tags)
        : store_(store),
          item_(item),
          tags_(tags),
          everything_(store.term(term(TermKind::everything)).value_or(0)) {
        const std::set<std::string> keys = keyTerms();
        const std::string start = term(TermKind::tag);
        store.forEachTerm(start, {"u", 1}, [&](TermId id, std::string_view value) {
            tagTerms_.push_back({id, tags.weight(value), keys.contains(std::string(value)),
                                 item.key.contains(std::string(value))});
        });
        for (std::size_t i = 0; i < kMeasures.size(); ++i) addGroups(i);
    }

    /// Calls `visit` for each item of the chunk with an upper bound of its likeness.
    template <typename Visit>
    void forEachBound(std::int64_t chunk, Visit visit) {
        entries_.assign(kChunkSize, {});
        for (const TagOfIndex& tag : tagTerms_) {
            forEachOf(tag.id, chunk, [&tag](Entry& entry) {
                ++entry.tags;
                entry.shared += tag.weight;
                if (tag.isKey) ++entry.keys;
                if (tag.isKeyOfItem) ++entry.commonKeys;
            });
        }
        for (const Group& group : groups_) {
            forEachOf(group.id, chunk, [&group](Entry& entry) {
                double& number = entry.numbers[group.measure];
                number = std::max(number, group.closeness);
            });
        }
        IdSet all;
        store_.addPosting(everything_, chunk, all);
        all.forEach([&](std::uint16_t id) {
            visit(chunk << kChunkBits | id, bound(entries_[id]));
            return true;
        });
    }

  private:
    struct TagOfIndex {
        TermId id;
        double weight;
        bool isKey;
        bool isKeyOfItem;
    };
    struct Group {
        TermId id;
        std::size_t measure;
        double closeness;
    };
    /// Small, since a chunk has 65,536 of them.
    struct Entry {
        double shared = 0;
        Closenesses numbers = kAllUnknown;
        std::uint32_t tags = 0;
        std::uint8_t keys = 0;
        std::uint8_t commonKeys = 0;
    };

    void addGroups(std::size_t measure) {
        const auto number = item_.numbers[measure];
        if (!number) return;
        const std::string field = term(TermKind::fineNumber, fieldOf(kMeasures[measure]));
        store_.forEachTerm(field + '\0', field + '\1', [&](TermId id, std::string_view value) {
            const NumberGroup group = numberGroupOfTerm(value);
            if (kMeasures[measure].isRatio && group.last <= 0) return;
            const double nearest = std::clamp(*number, group.first, group.last);
            groups_.push_back({id, measure, closeness(kMeasures[measure], *number, nearest)});
        });
    }

    template <typename Change>
    void forEachOf(TermId term, std::int64_t chunk, Change change) {
        IdSet ids;
        store_.addPosting(term, chunk, ids);
        ids.forEach([&](std::uint16_t id) {
            change(entries_[id]);
            return true;
        });
    }

    double bound(const Entry& entry) const {
        Likeness most{tags_.likeness(entry.shared, entry.tags), kUnknown, entry.numbers};
        if (!item_.key.empty() && entry.keys > 0) {
            const bool isSame = entry.keys == entry.commonKeys && entry.keys == item_.key.size();
            most.key = isSame ? 1 : 0;
        }
        return most.mean();
    }

    ContentStore& store_;
    const Facts& item_;
    const WeighedTags& tags_;
    TermId everything_;
    std::vector<TagOfIndex> tagTerms_;
    std::vector<Group> groups_;
    std::vector<Entry> entries_;
};

/// Sorts the most alike first, then by number: the likeness is negated.
using Rank = std::pair<double, ItemId>;

}  // namespace

bool isComparable(const IndexedItem& item) {
    return !factsOf(item).isEmpty();
}

std::vector<Similar> similarItems(ContentStore& store, ItemId id, std::size_t limit) {
    const auto item = store.item(id);
    if (!item || limit == 0) return {};
    const Facts facts = factsOf(*item);
    const std::int64_t lastChunk = store.lastId() >> kChunkBits;
    const WeighedTags tags(store, facts, lastChunk);
    LikenessIndex index(store, facts, tags);
    std::vector<Rank> candidates;
    for (std::int64_t chunk = 0; chunk <= lastChunk; ++chunk) {
        index.forEachBound(chunk, [&](ItemId candidate, double bound) {
            if (bound > 0 && candidate != id) candidates.emplace_back(-bound, candidate);
        });
    }
    // Items are read in the order of their bounds until no further one can beat the best so far.
    std::make_heap(candidates.begin(), candidates.end(), std::greater<>());
    std::map<Rank, IndexedItem> best;
    while (!candidates.empty()) {
        const Rank next = candidates.front();
        if (best.size() == limit && best.rbegin()->first < next) break;
        std::pop_heap(candidates.begin(), candidates.end(), std::greater<>());
        candidates.pop_back();
        auto other = store.item(next.second);
        const double value = other ? likeness(facts, tags, factsOf(*other)).mean() : 0;
        if (value <= 0) continue;
        best.emplace(Rank{-value, next.second}, std::move(*other));
        if (best.size() > limit) best.erase(std::prev(best.end()));
    }
    std::vector<Similar> result;
    result.reserve(best.size());
    for (auto& [rank, other] : best) result.push_back({rank.second, std::move(other), -rank.first});
    return result;
}

}  // namespace qvct::contentdb
