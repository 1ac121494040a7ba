#include "Library.h"

#include <algorithm>
#include <cmath>
#include <map>
#include <set>

#include <fmt/format.h>
#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;

/// Queries of every kind of term, alone and combined, from the words and tags that the items are made of.
class QueryGenerator {
  public:
    explicit QueryGenerator(std::uint64_t seed) : items_(seed) {}

    std::string next() {
        std::string query;
        for (std::size_t left = 1 + pick(3); left > 0; --left) {
            if (!query.empty()) query += pick(5) == 0 ? " , " : " ";
            if (pick(4) == 0) query += "-";
            query += term();
        }
        if (pick(3) == 0) query += " " + std::string(kOrders[pick(kOrders.size())]);
        return query;
    }

  private:
    std::size_t pick(std::size_t count) { return items_.pick(count); }
    std::string quoted(std::string_view text) { return "\"" + std::string(text) + "\""; }

    std::string range(double scale) {
        double low = static_cast<double>(pick(2000)) / 1000 * scale;
        double high = static_cast<double>(pick(2000)) / 1000 * scale;
        if (low > high) std::swap(low, high);
        const std::string ranges[] = {fmt::format(":{}..{}", low, high),
                                      fmt::format(":{:.0f}..{:.0f}", std::floor(low), std::ceil(high)),
                                      fmt::format(">{}", low),
                                      fmt::format("<={:.0f}", high),
                                      fmt::format(":..{}", high),
                                      fmt::format(":{:.0f}", low)};
        return ranges[pick(std::size(ranges))];
    }

    std::string term() {
        const std::string tag = quoted(items_.tag().label);
        const std::string terms[] = {
            items_.word(),
            items_.word().substr(0, 1 + pick(3)),
            quoted(items_.word()),
            quoted(items_.word() + " " + items_.word()),
            items_.word() + "," + items_.word(),
            "tag:" + tag,
            (pick(2) == 0 ? "GENRE:" : "source:") + tag + "," + quoted(items_.tag().label),
            "level:" + tag + (pick(4) == 0 ? "" : range(0.5)),
            "bpm" + range(100),
            pick(2) == 0 ? "length" + range(12) : "gain" + range(-1),
            "beats:" + std::to_string(4U << pick(4)),
            pick(2) == 0 ? "key:A" : "key:C#m",
            pick(2) == 0 ? "type:loop" : "pack:\"pack " + std::to_string(pick(20)) + "\"",
            "path:" + quoted(items_.word() + "/"),
            pick(2) == 0 ? "name::^k.*[13579]" : "genre::^deep",
            std::string(kOddTerms[pick(kOddTerms.size())])};
        return terms[pick(std::size(terms))];
    }

    static constexpr std::array<std::string_view, 6> kOrders = {"bpm+",         "bpm-",  "name+",
                                                                "genre- name+", "size-", "length+"};
    static constexpr std::array<std::string_view, 7> kOddTerms = {
        "\xf0\x9f\xa5\x81", "%", "STRASSE", "cafe", "\"\xc3\xa9tude\"", "line", "size>50000"};

    ItemGenerator items_;
};

std::vector<std::int64_t> inMemory(const Query& query, const std::vector<IndexedItem>& items,
                                   std::size_t limit) {
    std::vector<std::int64_t> ids;
    for (std::size_t i = 0; i < items.size(); ++i) {
        if (matches(query, items[i])) ids.push_back(static_cast<std::int64_t>(i + 1));
    }
    const auto item = [&items](std::int64_t id) -> const IndexedItem& {
        return items[static_cast<std::size_t>(id - 1)];
    };
    std::stable_sort(ids.begin(), ids.end(),
                     [&](std::int64_t a, std::int64_t b) { return comesBefore(query, item(a), item(b)); });
    if (ids.size() > limit) ids.resize(limit);
    return ids;
}

TEST(Evaluators, FindTheSameInTheSameOrder) {
    const TemporaryFolder folder;
    std::size_t queriesWithMatches = 0;
    for (const std::uint64_t seed : {1U, 2U, 3U}) {
        std::vector<IndexedItem> items = generatedItems(seed, 400);
        items[7].failure = "cannot be read";
        const std::string path = folder.path("library" + std::to_string(seed));
        store(path, items);
        const auto database = ContentDatabase::open(path);
        ASSERT_NE(database, nullptr);
        const Vocabulary vocabulary = *database->vocabulary();
        QueryGenerator queries(seed);
        for (int i = 0; i < 200; ++i) {
            const std::string text = queries.next();
            QueryError error;
            const auto query = parseQuery(text, vocabulary, &error);
            ASSERT_TRUE(query) << text << ": " << error.message;
            const std::size_t limit = i % 2 == 0 ? 10 : items.size();
            const auto found = database->search(*query, limit);
            ASSERT_TRUE(found) << text;
            std::vector<std::int64_t> ids;
            for (const Found& one : *found) ids.push_back(one.id);
            EXPECT_EQ(ids, inMemory(*query, items, limit)) << text;
            EXPECT_EQ(*database->count(*query),
                      static_cast<std::int64_t>(inMemory(*query, items, items.size()).size()))
                << text;
            if (!ids.empty()) ++queriesWithMatches;
        }
    }
    EXPECT_GT(queriesWithMatches, 250U);
}

TEST(Evaluators, CountTagsOfTheMatchesAsASearchForThemWould) {
    const TemporaryFolder folder;
    const std::vector<IndexedItem> items = generatedItems(5, 800);
    store(folder.path("db"), items);
    const auto database = ContentDatabase::open(folder.path("db"));
    const Vocabulary vocabulary = *database->vocabulary();
    const auto counts = database->facets(*parseQuery("kick bpm:80..140", vocabulary, nullptr));
    ASSERT_TRUE(counts);
    EXPECT_GT(counts->size(), 5U);
    for (const Facet& facet : *counts) {
        const std::string text = fmt::format("kick bpm:80..140 \"{}\":\"{}\"", facet.category, facet.label);
        const auto query = parseQuery(text, vocabulary, nullptr);
        ASSERT_TRUE(query) << text;
        EXPECT_EQ(inMemory(*query, items, items.size()).size(), static_cast<std::size_t>(facet.count))
            << text;
    }
}

using Tags = std::set<std::pair<std::string, std::string>>;

Tags tagsOf(const IndexedItem& item) {
    Tags tags;
    for (const IndexedTagging& tagging : item.taggings) {
        tags.emplace(tagging.label, tagging.category);
        for (const std::string& above : tagging.ancestors) tags.emplace(above, tagging.category);
    }
    return tags;
}

Tags keysOf(Tags tags) {
    std::erase_if(tags, [](const auto& tag) { return tag.first != "A" && tag.first != "CSharp"; });
    return tags;
}

std::optional<double> levelOf(const IndexedItem& item, const char* label) {
    for (const IndexedTagging& tagging : item.taggings) {
        if (tagging.label == label && tagging.level) return *tagging.level;
    }
    return std::nullopt;
}

std::optional<double> octaveOf(const IndexedItem& item) {
    for (const IndexedValue& value : item.values) {
        if (value.key == "Tempo") return std::log2(std::get<double>(value.value));
    }
    return std::nullopt;
}

/// How similar each item is to the one, by comparing it with all.
std::vector<double> similarities(const std::vector<IndexedItem>& items, const IndexedItem& one) {
    std::map<std::pair<std::string, std::string>, double> counts;
    double described = 0;
    for (const IndexedItem& item : items) {
        if (!item.failure.empty()) continue;
        ++described;
        for (const auto& tag : tagsOf(item)) ++counts[tag];
    }
    const auto weight = [&](const auto& tag) { return std::log2(1 + described / counts[tag]); };
    const Tags tags = tagsOf(one);
    double own = 0;
    for (const auto& tag : tags) own += weight(tag);
    std::vector<double> result;
    for (const IndexedItem& other : items) {
        double sum = 0;
        double weights = 0;
        const auto add = [&](std::optional<double> a, std::optional<double> b, double half) {
            if (!a || !b) return;
            sum += 1 / (1 + std::abs(*a - *b) / half);
            ++weights;
        };
        add(levelOf(one, "Rhythmic Density"), levelOf(other, "Rhythmic Density"), 0.2);
        add(levelOf(one, "Rhythmic Complexity"), levelOf(other, "Rhythmic Complexity"), 0.2);
        add(octaveOf(one), octaveOf(other), 0.1375);
        const Tags tagsOfOther = tagsOf(other);
        if (!tags.empty()) {
            double shared = 0;
            for (const auto& tag : tagsOfOther) shared += tags.contains(tag) ? weight(tag) : 0;
            const double mean = own / static_cast<double>(tags.size());
            const double beyond = static_cast<double>(tagsOfOther.size()) * mean - shared;
            sum += 4 * std::min(1.0, shared / (own + std::max(0.0, beyond)));
            weights += 4;
        }
        if (!keysOf(tags).empty() && !keysOf(tagsOfOther).empty()) {
            sum += keysOf(tags) == keysOf(tagsOfOther) ? 1 : 0;
            ++weights;
        }
        result.push_back(&other == &one || weights == 0 || !other.failure.empty() ? 0 : sum / weights);
    }
    return result;
}

void expectNearest(ContentDatabase& database, const std::vector<IndexedItem>& items, std::size_t at,
                   std::size_t limit) {
    const std::vector<double> all = similarities(items, items[at]);
    std::vector<double> best = all;
    std::sort(best.rbegin(), best.rend());
    best.resize(std::min(limit, best.size()));
    std::erase_if(best, [](double similarity) { return similarity <= 0; });
    const auto found = database.similar(items[at].path, limit);
    ASSERT_TRUE(found);
    ASSERT_EQ(found->size(), best.size());
    std::pair<double, ItemId> before{-2, 0};
    for (std::size_t rank = 0; rank < best.size(); ++rank) {
        const Similar& one = (*found)[rank];
        EXPECT_NEAR(one.similarity, best[rank], 1e-6) << rank;
        EXPECT_NEAR(one.similarity, all[static_cast<std::size_t>(one.id - 1)], 1e-6) << rank;
        EXPECT_LT(before, std::pair(-one.similarity, one.id)) << rank;
        before = {-one.similarity, one.id};
    }
}

TEST(Evaluators, FindTheSimilarItemsThatComparingAllWouldFind) {
    const TemporaryFolder folder;
    std::vector<IndexedItem> items = generatedItems(9, 700);
    // Tempos that stand in one group of the index and are as far from another as to decide.
    for (std::size_t i = 0; i < items.size(); i += 2) {
        items[i].taggings.resize(std::min<std::size_t>(items[i].taggings.size(), 1));
        items[i].values = {{"Tempo", 120 + 0.01 * static_cast<double>(i * 37 % 100)}};
    }
    items[7].failure = "cannot be read";
    items[8].taggings.clear();
    items[8].values = {{"Tempo", 126.5}};
    items[9].taggings.clear();
    items[9].values.clear();
    store(folder.path("db"), items);
    const auto database = ContentDatabase::open(folder.path("db"));
    for (std::size_t at = 8; at < 120; at += at == 8 ? 2 : 1) {
        if (tagsOf(items[at]).empty() && !octaveOf(items[at])) continue;
        for (const std::size_t limit : {std::size_t{1}, std::size_t{20}, items.size()})
            expectNearest(*database, items, at, limit);
    }
    const std::pair<std::string, std::string> refusals[] = {
        {items[7].path, "could not be read when it was indexed"},
        {items[9].path, "no tags, rhythm or tempo"},
        {"/Library/none.wav", "not in the index"}};
    for (const auto& [path, reason] : refusals) {
        Error error;
        EXPECT_FALSE(database->similar(path, 5, &error));
        EXPECT_THAT(error.message(), testing::HasSubstr(path + ": " + reason));
    }
}

TEST(Evaluators, FindTheSimilarItemsAmongManyOfTheSameTags) {
    const TemporaryFolder folder;
    std::vector<IndexedItem> items = generatedItems(2, 900);
    for (std::size_t i = 0; i < items.size(); ++i) {
        items[i].taggings = {{"Kick", "Source", {"Drums"}, {}, Provenance::stored, {}}};
        items[i].values = {{"Tempo", i % 45 == 44 ? 140.0 : 90.0}};
    }
    store(folder.path("db"), items);
    const auto database = ContentDatabase::open(folder.path("db"));
    const auto found = database->similar(items[89].path, 19);
    ASSERT_TRUE(found);
    for (const Similar& one : *found) EXPECT_EQ(one.id % 45, 0) << one.id;
    expectNearest(*database, items, 89, 19);
}

}  // namespace
}  // namespace qvct::test
