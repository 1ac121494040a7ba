#include "Library.h"
#include "NameDescriber.h"
#include "contentdb/store/codec/SoundCodec.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <filesystem>
#include <functional>
#include <random>
#include <thread>

#include <fmt/format.h>
#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;
using testing::ElementsAre;
using testing::HasSubstr;

/// Places of sounds as libraries have them: around some kinds, with copies in the same place.
class PlaceGenerator {
  public:
    explicit PlaceGenerator(unsigned seed) : random_(seed) {
        for (SoundLikeness& kind : kinds_) kind = near({}, 50);
    }

    SoundLikeness next() {
        if (pick(5) != 0) last_ = near(kinds_[pick(kinds_.size())], 9);
        return last_;
    }
    std::size_t pick(std::size_t count) {
        return std::uniform_int_distribution<std::size_t>(0, count - 1)(random_);
    }

  private:
    SoundLikeness near(const SoundLikeness& middle, double spread) {
        SoundLikeness place;
        for (std::size_t i = 0; i < SoundLikeness::kSize; ++i) {
            const double value = std::normal_distribution<>(middle.coordinates[i], spread)(random_);
            place.coordinates[i] = static_cast<std::int8_t>(std::clamp(value, -127.0, 127.0));
        }
        return place;
    }

    std::mt19937 random_;
    std::array<SoundLikeness, 12> kinds_{};
    SoundLikeness last_;
};

/// Some have not been heard.
std::vector<IndexedItem> heardItems(unsigned seed, std::size_t count) {
    PlaceGenerator places(seed);
    std::vector<IndexedItem> items = generatedItems(seed, count);
    for (IndexedItem& item : items)
        if (places.pick(10) != 0) item.likeness = encodedLikeness(places.next());
    return items;
}

/// The paths of those that are nearest to one, by comparing all. Of equally near ones the first.
std::vector<std::string> nearest(const std::vector<IndexedItem>& items, const IndexedItem& one,
                                 std::size_t limit, const std::function<bool(const IndexedItem&)>& counts) {
    std::vector<std::pair<int, std::size_t>> order;
    const auto place = decodedLikeness(one.likeness)->place;
    for (std::size_t i = 0; i < items.size(); ++i) {
        const auto its = decodedLikeness(items[i].likeness);
        if (its && counts(items[i])) order.emplace_back(squaredDistance(place, its->place), i);
    }
    std::sort(order.begin(), order.end());
    order.resize(std::min(order.size(), limit));
    std::vector<std::string> paths;
    for (const auto& [distance, i] : order) paths.push_back(items[i].path);
    return paths;
}

std::vector<std::string> soundingLike(ContentDatabase& database, const std::string& path, std::size_t limit) {
    Error error;
    const auto found = database.soundingLike(path, limit, &error);
    EXPECT_TRUE(found) << error.message();
    std::vector<std::string> paths;
    if (!found) return paths;
    for (const Similar& one : *found) paths.push_back(one.item.path);
    return paths;
}

/// That some of the items find what comparing all of them finds, and that nothing else is wrong.
void expectRight(const std::string& path, const std::vector<IndexedItem>& items) {
    const auto database = ContentDatabase::open(path);
    for (std::size_t i = 0; i < items.size(); i += 29) {
        if (items[i].likeness.empty()) continue;
        const auto isOther = [&](const IndexedItem& item) { return item.path != items[i].path; };
        EXPECT_EQ(soundingLike(*database, items[i].path, 7), nearest(items, items[i], 7, isOther)) << i;
    }
    Error error;
    EXPECT_TRUE(database->check(&error)) << error.message();
}

TEST(Likeness, FindsWhatComparingAllFindsAlsoAfterChanges) {
    const TemporaryFolder folder;
    const std::string path = folder.path("db");
    std::vector<IndexedItem> items = heardItems(1, 1000);
    store(path, items);
    expectRight(path, items);
    const std::vector<IndexedItem> other = heardItems(2, 1000);
    const auto put = [&](StoreWriter& writer, std::size_t i) {
        writer.put(static_cast<ItemId>(i + 1), items[i], termsOf(items[i]));
    };
    change(
        path, [&](StoreWriter& writer) { writer.remove(3); }, false);
    expectRight(path, items);
    change(path, [&](StoreWriter& writer) {
        for (std::size_t i = 0; i < 400; ++i) {
            items[i].likeness = other[i].likeness;  // elsewhere, or not heard any more
            put(writer, i);
        }
        for (std::size_t i = 300; i < 350; ++i) {  // twice in one batch
            items[i].likeness = other[i + 500].likeness;
            put(writer, i);
        }
        for (std::size_t i = 999; i >= 900; --i) writer.remove(static_cast<ItemId>(i + 1));
    });
    items.resize(900);
    expectRight(path, items);
}

TEST(Likeness, IsKeptWhenDatabasesAreMergedAndBroughtToTheFormOfToday) {
    const TemporaryFolder folder;
    std::vector<IndexedItem> items = heardItems(3, 600);
    for (std::size_t i = 0; i < items.size(); ++i) items[i].path = fmt::format("/a/{:04}.wav", i);
    store(folder.path("one"), {items.begin(), items.begin() + 200});
    store(folder.path("two"), {items.begin() + 200, items.end()});
    Error error;
    ASSERT_TRUE(mergeDatabases({folder.path("two"), folder.path("one")}, folder.path("all"), &error))
        << error.message();
    expectRight(folder.path("all"), items);
    // Before this there was nothing to keep.
    const std::string old = folder.path("old");
    store(old, generatedItems(3, 600));
    Connection(old, Connection::Mode::readWrite).run("DROP TABLE likeness; PRAGMA user_version = 3");
    change(old, [&](StoreWriter& writer) {
        for (ItemId id = 1; id <= 600; ++id) writer.remove(id);
        for (std::size_t i = 0; i < 600; ++i)
            writer.put(static_cast<ItemId>(i + 1), items[i], termsOf(items[i]));
    });
    expectRight(old, items);
}

TEST(Likeness, OfWhatCouldBeReadIsInARebuiltDatabase) {
    const TemporaryFolder folder;
    const std::string path = folder.path("db");
    store(path, heardItems(6, 1200));
    std::string bytes = readAll(path);
    for (std::size_t at = 40 * 8192 + 100; at < bytes.size(); at += 8192 * 9)
        bytes[at] = static_cast<char>(bytes[at] ^ 1);
    folder.write("db", bytes);
    std::filesystem::create_directory(folder.path("empty"));
    IndexOptions options;
    options.folders = {folder.path("empty")};
    options.database = path;
    Error error;
    ASSERT_TRUE(indexLibrary(
        options, [] { return std::make_unique<NameDescriber>(); }, &error))
        << error.message();
    const auto database = ContentDatabase::open(path);
    std::vector<IndexedItem> items;
    const auto left = database->search(*parseQuery("", *database->vocabulary(), nullptr), 2000);
    for (const Found& found : *left) items.push_back(found.item);
    EXPECT_GT(items.size(), 600U);
    EXPECT_LT(items.size(), 1200U);
    expectRight(path, items);
}

TEST(Likeness, OfADamagedDatabaseIsToldAndNotBelieved) {
    const std::vector<IndexedItem> items = heardItems(4, 300);
    const std::string whole = "the cells of sounds do not hold what was heard";
    const std::string& heard = items[1].likeness.empty() ? items[2].path : items[1].path;
    struct Case {
        std::string damage;
        bool isSeenBySearch;
        std::string reason;
    };
    const std::vector<Case> cases = {
        {"UPDATE likeness SET entries = substr(entries, 2)", true, "a cell of sounds"},
        {"UPDATE likeness SET entries = substr(entries, 1, length(entries) - 66) WHERE length(entries) > 66",
         false, whole},
        {"DELETE FROM likeness WHERE key = (SELECT max(key) FROM likeness)", false, whole},
        {"UPDATE likeness SET key = key + 65536 * 70000 WHERE key = (SELECT max(key) FROM likeness)", false,
         whole},
        {"UPDATE likeness SET entries = CAST(entries || entries AS BLOB)", false, whole}};
    for (const Case& one : cases) {
        const TemporaryFolder folder;
        store(folder.path("db"), items);
        Connection(folder.path("db"), Connection::Mode::readWrite).run(one.damage.c_str());
        const auto database = ContentDatabase::open(folder.path("db"));
        Error error;
        EXPECT_EQ(!database->soundingLike(heard, 10, &error), one.isSeenBySearch) << one.damage;
        if (one.isSeenBySearch) {
            EXPECT_THAT(error.message(), HasSubstr(one.reason));
        }
        EXPECT_FALSE(database->check(&error)) << one.damage;
        EXPECT_THAT(error.message(), HasSubstr(one.reason)) << one.damage;
    }
    for (auto part : {&IndexedItem::likeness, &IndexedItem::fingerprint}) {
        const TemporaryFolder folder;
        std::vector<IndexedItem> broken = items;
        broken[5].*part = "xyz";
        store(folder.path("db"), broken);
        Error error;
        EXPECT_FALSE(ContentDatabase::open(folder.path("db"))->check(&error));
        EXPECT_THAT(error.message(), HasSubstr("what was heard in " + printable(broken[5].path)));
    }
}

TEST(Likeness, OfEquallyNearSoundsNamesTheOlderFirst) {
    const TemporaryFolder folder;
    std::vector<IndexedItem> items = generatedItems(7, 2 * SoundLikeness::kSize + 1);
    for (std::size_t i = 0; i + 1 < items.size(); ++i) {
        SoundLikeness place;
        place.coordinates[i / 2] = i % 2 == 0 ? 90 : -90;
        items[i].likeness = encodedLikeness(place);
    }
    items.back().likeness = encodedLikeness(SoundLikeness());
    store(folder.path("db"), items);
    const auto found = soundingLike(*ContentDatabase::open(folder.path("db")), items.back().path, 5);
    EXPECT_THAT(found,
                ElementsAre(items[0].path, items[1].path, items[2].path, items[3].path, items[4].path));
}

TEST(Likeness, TellsCopiesFromSoundsWithALandmarkInCommon) {
    std::vector<IndexedItem> items = generatedItems(8, 40);
    std::mt19937 random(1);
    const auto fingerprint = [&random](std::vector<SoundFingerprint::Landmark> landmarks) {
        for (std::uint16_t i = static_cast<std::uint16_t>(landmarks.size()); i < 24; ++i)
            landmarks.push_back({static_cast<std::uint32_t>(random()), static_cast<std::uint16_t>(40 * i)});
        return SoundFingerprint{landmarks};
    };
    const SoundFingerprint one = fingerprint({});
    for (IndexedItem& item : items) {
        item.fingerprint = encodedFingerprint(fingerprint({one.landmarks[0]}));
        item.values.clear();  // so that none is longer
    }
    SoundFingerprint copy = one;
    copy.landmarks.resize(15);
    for (auto& landmark : copy.landmarks) landmark.frame = static_cast<std::uint16_t>(landmark.frame + 7);
    items[5].fingerprint = encodedFingerprint(one);
    items[30].fingerprint = encodedFingerprint(copy);
    items[12].fingerprint = items[9].fingerprint = "";  // as of patches
    items[12].payloadHash = items[9].payloadHash;
    const TemporaryFolder folder;
    store(folder.path("db"), items);
    std::vector<std::string> groups;
    const auto note = [&groups](const DuplicateGroup& group) {
        std::string text;
        for (const SoundCopy& each : group.copies)
            text += fmt::format("{}{} ", each.id, each.isExact ? " exact" : "");
        groups.push_back(text);
        return true;
    };
    Error error;
    EXPECT_TRUE(ContentDatabase::open(folder.path("db"))->forEachDuplicate(Query{}, note, &error))
        << error.message();
    EXPECT_THAT(groups, ElementsAre("6 exact 31 ", "10 exact 13 exact "));
}

TEST(Likeness, InQueriesIsOfWhatMeetsTheRest) {
    const TemporaryFolder folder;
    const std::vector<IndexedItem> items = heardItems(5, 2000);
    store(folder.path("db"), items);
    const auto database = ContentDatabase::open(folder.path("db"));
    const Vocabulary vocabulary = *database->vocabulary();
    const auto one = std::find_if(items.begin() + 40, items.end(), [](const IndexedItem& item) {
        return !item.likeness.empty() && item.path.find('"') == std::string::npos && isValidUtf8(item.path);
    });
    for (const char* rest :
         {"", "kick", "bpm:90..140", "path:a", "name::[13579]$", "nothing-has-this", "-kick path:o"}) {
        const auto query = parseQuery(fmt::format("{} like:\"{}\"", rest, one->path), vocabulary, nullptr);
        ASSERT_TRUE(query) << rest;
        const auto meets = [&](const IndexedItem& item) {
            return matches(*parseQuery(rest, vocabulary, nullptr), item);
        };
        for (const std::size_t limit : {0U, 5U, 1000U}) {
            std::vector<std::string> paths;
            const auto found = database->search(*query, limit);
            for (const Found& each : *found) paths.push_back(each.item.path);
            EXPECT_EQ(paths, nearest(items, *one, std::min(limit, kMostAlike), meets)) << rest;
        }
        const auto alike = nearest(items, *one, kMostAlike, meets);
        EXPECT_EQ(database->count(*query), static_cast<std::int64_t>(alike.size())) << rest;
        const auto facets = database->facets(*query);
        for (const Facet& facet : *facets) EXPECT_LE(facet.count, 100);
    }
    const auto sorted = parseQuery(fmt::format("like:\"{}\" bpm-", one->path), vocabulary, nullptr);
    const auto found = *database->search(*sorted, 100);
    EXPECT_TRUE(std::is_sorted(found.begin(), found.end(), [&](const Found& a, const Found& b) {
        return comesBefore(*sorted, a.item, b.item);
    }));
    Error error;
    EXPECT_FALSE(database->search(*parseQuery("like:none.wav", vocabulary, nullptr), 5, &error));
    EXPECT_THAT(error.message(), HasSubstr("none.wav"));
}

}  // namespace
}  // namespace qvct::test
