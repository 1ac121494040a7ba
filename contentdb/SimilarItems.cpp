#include "contentdb/QueryFields.h"
#include "contentdb/Search.h"
#include "contentdb/Terms.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <set>

namespace qvct::contentdb {
namespace {

/// The terms of an item's tags and of those above them.
std::set<std::string> tagTerms(const IndexedItem& item) {
    std::set<std::string> terms;
    for (const IndexedTagging& tagging : item.taggings) {
        terms.insert(tagTerm(tagging.label, tagging.category));
        for (const std::string& ancestor : tagging.ancestors)
            terms.insert(tagTerm(ancestor, tagging.category));
    }
    return terms;
}

/// How close two numbers are: 1 when equal, falling to half at `half` apart. Nothing when either is unknown.
std::optional<double> closeness(const std::vector<double>& a, const std::vector<double>& b, double half) {
    if (a.empty() || b.empty()) return std::nullopt;
    return 1 / (1 + std::abs(a[0] - b[0]) / half);
}

std::vector<double> octaves(std::vector<double> numbers) {
    std::erase_if(numbers, [](double number) { return number <= 0; });
    for (double& number : numbers) number = std::log2(number);
    return numbers;
}

/// Mean of what is known of both: tags weigh half, rhythm, tempo and key the rest. Unknown facts neither
/// speak for an item nor against it.
double similarity(const IndexedItem& a, const IndexedItem& b, double tagSimilarity) {
    struct Aspect {
        std::optional<double> closeness;
        double weight;
    };
    const auto level = [](const IndexedItem& item, const char* label) {
        return numbersInField(item, {Field::Kind::level, label});
    };
    const auto tempo = [](const IndexedItem& item) {
        return octaves(numbersInField(item, {Field::Kind::number, "tempo"}));
    };
    const std::vector<std::string> keyOfA = textsInField(a, {Field::Kind::key, {}});
    const std::vector<std::string> keyOfB = textsInField(b, {Field::Kind::key, {}});
    std::optional<double> key;
    if (!keyOfA.empty() && !keyOfB.empty()) key = keyOfA == keyOfB ? 1 : 0;
    constexpr double fifthOfRange = 0.2;
    constexpr double tenPercent = 0.1375;  // octaves
    const std::array<Aspect, 5> aspects = {
        {{tagSimilarity, 4},
         {closeness(level(a, "Rhythmic Density"), level(b, "Rhythmic Density"), fifthOfRange), 1},
         {closeness(level(a, "Rhythmic Complexity"), level(b, "Rhythmic Complexity"), fifthOfRange), 1},
         {closeness(tempo(a), tempo(b), tenPercent), 1},
         {key, 1}}};
    double sum = 0;
    double weights = 0;
    for (const Aspect& aspect : aspects) {
        if (!aspect.closeness) continue;
        sum += *aspect.closeness * aspect.weight;
        weights += aspect.weight;
    }
    return sum / weights;
}

/// For each tag of the item how much it tells: the fewer items have it, the more.
struct WeighedTag {
    TermId term;
    double weight;
};

std::vector<WeighedTag> weighedTags(ContentStore& store, const IndexedItem& item, std::int64_t lastChunk) {
    const double items = static_cast<double>(std::max<std::int64_t>(store.countOfItems(), 1));
    std::vector<WeighedTag> result;
    for (const std::string& value : tagTerms(item)) {
        const auto id = store.term(value);
        if (!id) continue;
        double count = 0;
        for (std::int64_t chunk = 0; chunk <= lastChunk; ++chunk) {
            IdSet ids;
            store.addPosting(*id, chunk, ids);
            count += ids.count();
        }
        result.push_back({*id, std::log2(1 + items / std::max(count, 1.0))});
    }
    return result;
}

struct Candidate {
    double shared;  // weight of the tags in common
    ItemId id;
};

/// The items that share most, best first.
std::vector<Candidate> candidates(ContentStore& store, const std::vector<WeighedTag>& tags, ItemId self,
                                  std::int64_t lastChunk, std::size_t count) {
    const auto isBetter = [](const Candidate& a, const Candidate& b) {
        return a.shared > b.shared || (a.shared == b.shared && a.id < b.id);
    };
    std::vector<Candidate> best;
    std::vector<double> shared(kChunkSize);
    for (std::int64_t chunk = 0; chunk <= lastChunk; ++chunk) {
        std::fill(shared.begin(), shared.end(), 0);
        for (const WeighedTag& tag : tags) {
            IdSet ids;
            store.addPosting(tag.term, chunk, ids);
            ids.forEach([&](std::uint16_t id) {
                shared[id] += tag.weight;
                return true;
            });
        }
        for (std::uint32_t id = 0; id < kChunkSize; ++id) {
            const Candidate candidate{shared[id], chunk << kChunkBits | id};
            if (candidate.shared <= 0 || candidate.id == self) continue;
            if (best.size() == count && !isBetter(candidate, best.front())) continue;
            best.push_back(candidate);
            std::push_heap(best.begin(), best.end(), isBetter);
            if (best.size() <= count) continue;
            std::pop_heap(best.begin(), best.end(), isBetter);
            best.pop_back();
        }
    }
    std::sort_heap(best.begin(), best.end(), isBetter);
    return best;
}

}  // namespace

std::vector<Similar> similarItems(ContentStore& store, ItemId id, std::size_t limit) {
    std::vector<Similar> result;
    const auto item = store.item(id);
    if (!item || limit == 0) return result;
    // Those that share most tags are looked at closely; rhythm, tempo and key only put them in order.
    constexpr std::size_t pool = 500;
    const std::int64_t lastChunk = store.lastId() >> kChunkBits;
    const std::vector<WeighedTag> tags = weighedTags(store, *item, lastChunk);
    double own = 0;
    for (const WeighedTag& tag : tags) own += tag.weight;
    for (const Candidate& candidate : candidates(store, tags, id, lastChunk, std::max(pool, limit))) {
        auto other = store.item(candidate.id);
        if (!other) continue;
        const auto tagsOfOther = static_cast<double>(tagTerms(*other).size());
        const double meanWeight = own / static_cast<double>(tags.size());
        // What the other has beyond the common tags counts as so many tags of middling weight.
        const double sharedTags = candidate.shared / meanWeight;
        const double beyond = std::max(0.0, tagsOfOther - sharedTags) * meanWeight;
        const double tagSimilarity = std::min(1.0, candidate.shared / (own + beyond));
        const double value = similarity(*item, *other, tagSimilarity);
        result.push_back({candidate.id, std::move(*other), value});
    }
    std::stable_sort(result.begin(), result.end(),
                     [](const Similar& a, const Similar& b) { return a.similarity > b.similarity; });
    if (result.size() > limit) result.resize(limit);
    return result;
}

}  // namespace qvct::contentdb
