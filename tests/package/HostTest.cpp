// What hosts do that they should not, through the shared libraries and the headers as they are installed.

#include "demo/Library.h"
#include "demo/files/AudioFiles.h"
#include "support/Places.h"
#include "support/TemporaryFolder.h"

#include <atomic>
#include <chrono>
#include <filesystem>
#include <thread>

#include <gmock/gmock.h>
#include <qvcontenttagging/ContentDatabase.h>
#include <qvcontenttagging/ContentDescriber.h>
#include <qvcontenttagging/ContentWalk.h>
#include <qvcontenttagging/Indexer.h>
#include <qvcontenttagging/Log.h>
#include <qvcontenttagging/QVTaggingAggregator.h>
#include <qvcontenttagging/ReplacementFile.h>
#include <qvcontenttagging/ResourceBundle.h>
#include <qvcontenttagging/TGRTFileNode.h>
#include <qvcontenttagging/TGRTIndexableContentObject.h>
#include <qvcontenttagging/TGRTLegacyTaxonomyMapping.h>
#include <qvcontenttagging/TGRTMetaDataReaderFactory.h>
#include <qvcontenttagging/TGRTMetaDataWriterFactory.h>
#include <qvcontenttagging/TGRTTaxonomySearching.h>
#include <qvcontenttagging/TaggingSetAdditions.h>

namespace qvct {
namespace {

using test::TemporaryFolder;
using testing::Each;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

constexpr std::uint64_t kEverything = 0x3F8 | kReadLegacyTaggings | kReadMappedTaggings;

std::vector<URL> writeDemoLibrary(const TemporaryFolder& folder) {
    std::vector<URL> items;
    for (const std::string& path : demo::writeLibrary(folder.path()))
        items.push_back(URL::fileURLWithPath(folder.path(path)));
    return items;
}

URL soundIn(const TemporaryFolder& folder) {
    const URL url = URL::fileURLWithPath(folder.path("Deep House Beat.caf"));
    demo::writeSound(url.path(), {.samples = std::vector<float>(4410, 0.25F)});
    return url;
}

TEST(NullPointers, AreNoTaxonomyToReadWith) {
    const TemporaryFolder folder;
    const URL url = soundIn(folder);
    EXPECT_EQ(TGRTMetaDataReaderFactory::metaDataReaderForURL(url, nullptr), nullptr);
    EXPECT_EQ(TGRTBaseMetaDataReader::initWithTaxonomy(nullptr), nullptr);
    Error error;
    EXPECT_EQ(TGRTFileNode::nodeWithFileURL(url)->readMetaDataWithOptions(0, nullptr, &error), nullptr);
    EXPECT_EQ(error.code, kErrorInvalidArgument);
    EXPECT_THAT(error.message(), HasSubstr(url.path()));
    const auto searching = TGRTTaxonomySearching::initWithTaxonomy(nullptr);
    EXPECT_THAT(searching->findTagsForString("House"), IsEmpty());
    searching->setTaxonomy(nullptr);
    searching->_updateSearchTable();
    EXPECT_EQ(searching->tagForLabel("House"), nullptr);
}

TEST(NullPointers, AreNoTagsNoCategoriesAndNoTaggings) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    const std::size_t before = taxonomy->allTags().size();
    taxonomy->addCategory(nullptr);
    const auto category = taxonomy->findCategoryWithIdentifier("Genres");
    category->addTag(nullptr);
    category->removeTag(nullptr);
    const auto tag = taxonomy->findTagForLabel("House");
    tag->addChild(nullptr);
    tag->removeChild(nullptr);
    EXPECT_EQ(taxonomy->allTags().size(), before);
    EXPECT_FALSE(taxonomy->doesContainTag(nullptr));
    EXPECT_EQ(
        taxonomy->tagsForTaggings({nullptr, TGRTTagging::initWithTag(tag, nullptr)}, std::nullopt).size(), 1);
    EXPECT_EQ(TGRTTagging::initWithTag(nullptr, TGRTLevel::levelWithWeight(1)), nullptr);
    ObjectSet<TGRTTagging> taggings{nullptr, TGRTTagging::initWithTag(tag, nullptr)};
    EXPECT_FALSE(reassignTagWithLabel(taggings, "House", nullptr));
    EXPECT_EQ(taggings.size(), 1);
    EXPECT_THAT(TGRTTagging::taggingsWithTaggingDictionary(nullptr, *taxonomy), IsEmpty());
    EXPECT_EQ(TGRTMetaData::metaDataFromDictionary(nullptr, *taxonomy), nullptr);
    EXPECT_NE(TGRTTag::initWithLabel("Alone", nullptr, nullptr), nullptr);
}

TEST(NullPointers, WriteNothing) {
    const TemporaryFolder folder;
    const URL url = soundIn(folder);
    const std::string before = test::readAll(url.path());
    Error error;
    EXPECT_FALSE(TGRTMetaDataWriterFactory::metaDataWriterForURL(url)->writeMetaData(nullptr, url, &error));
    EXPECT_THAT(error.message(), HasSubstr(url.path()));
    EXPECT_FALSE(TGRTMetaDataWriterFactory::metaDataWriterForURL(url)->writeMetaData(nullptr, url));
    EXPECT_EQ(test::readAll(url.path()), before);
}

TEST(NullPointers, AreInputsThatAnItemDoesNotHave) {
    const URL url = URL::fileURLWithPath("/Loops/Deep House.patch");
    for (const auto& service :
         QVTaggingAggregator::defaultTaggingServicesWithRules(std::nullopt, std::nullopt))
        EXPECT_THAT(service->tagsWithContentsOfURL(url, nullptr, nullptr, nullptr, 0), IsEmpty());

    struct Aggregator : QVTaggingAggregator {
        Aggregator() : QVTaggingAggregator({nullptr, nullptr}) {}
    } aggregator;
    aggregator.setTaxonomy(nullptr);
    EXPECT_THAT(aggregator.tagsWithContentsOfURL(url, kEverything), IsEmpty());
}

TEST(NullPointers, AreFunctionsThatNobodyCalls) {
    const TemporaryFolder folder;
    folder.write("Kick.wav", "no sound");
    std::filesystem::create_symlink("nowhere", folder.path("Snare.wav"));
    walkContent(folder.path(), nullptr, nullptr);
    walkContent(folder.path("nowhere"), nullptr, nullptr);
    Error error;
    contentdb::IndexOptions options;
    options.folders = {folder.path()};
    options.database = folder.path("library.db");
    EXPECT_EQ(contentdb::indexLibrary(options, nullptr, &error), std::nullopt);
    EXPECT_EQ(error.code, kErrorInvalidArgument);
    EXPECT_FALSE(std::filesystem::exists(options.database));
}

/// Everything that a tagging says of itself.
std::vector<std::string> sayingsOf(const ObjectSet<TGRTTagging>& taggings) {
    std::vector<std::string> texts;
    for (const auto& tagging : taggings)
        texts.push_back(tagging->category() + ">" + tagging->parentLabel() + ">" + tagging->label() + ":" +
                        std::to_string(tagging->weightLevel()) + ":" + std::to_string(tagging->hash()));
    return texts;
}

TEST(BrokenResource, IsReportedByOneOfTheLibraries) {
    const TemporaryFolder folder;
    const std::string broken = folder.write("Rules.plist", "no rules");
    std::vector<std::string> lines;
    LogHandler handler = setLogHandler([&lines](std::string_view line) { lines.emplace_back(line); });
    ResourceBundle::setPathForResource("DefaultRules", "plist", broken);
    contentdb::ContentDescriber::digest(0);
    EXPECT_FALSE(replacementFile({"DefaultRules", "plist"}));
    ResourceBundle::setPathForResource("DefaultRules", "plist", std::nullopt);
    setLogHandler(std::move(handler));
    EXPECT_THAT(lines, ElementsAre(HasSubstr(broken)));
}

TEST(ReleasedTaxonomy, LeavesTaggingsWhatTheyAre) {
    const URL url = URL::fileURLWithPath("/Loops/Bright Deep House Topper.caf");
    const auto aggregator = QVTaggingAggregator::defaultTaggingAggregator();
    auto taxonomy = TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, true, false);
    const auto taggings =
        aggregator->taggingsWithContentsOfURL(url, *taxonomy, QVCTAutoTaggingOptionFilenameKeywords);
    ASSERT_THAT(taggings, Not(IsEmpty()));
    const auto before = sayingsOf(taggings);
    const std::weak_ptr<TGRTTaxonomy> gone = taxonomy;
    taxonomy.reset();
    ASSERT_TRUE(gone.expired());

    EXPECT_EQ(sayingsOf(taggings), before);
    for (const auto& tagging : taggings) {
        EXPECT_EQ(tagging->tag()->category(), nullptr);
        EXPECT_EQ(tagging->type(), tagging->tag()->valueType() == kTagValueBipolar ? 1 : 0);
        EXPECT_FALSE(TGRTTaxonomy::defaultTaxonomy()->doesContainTag(tagging->tag()));
        EXPECT_NE(tagging->displayString(), "");
    }
    // They are still what a writer stores, and what a set compares.
    EXPECT_THAT(TGRTTagging::taggingDictionaryForTaggings(taggings), Not(IsEmpty()));
    EXPECT_EQ(taggings, aggregator->taggingsWithContentsOfURL(url, *TGRTTaxonomy::defaultTaxonomy(),
                                                              QVCTAutoTaggingOptionFilenameKeywords));
}

/// What one thread finds out about the items.
std::vector<std::string> tagAll(const std::vector<URL>& items, QVTaggingAggregator& aggregator) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    const auto searching = TGRTTaxonomySearching::initWithTaxonomy(taxonomy);
    std::vector<std::string> results;
    for (const URL& url : items) {
        const auto taggings = aggregator.taggingsWithContentsOfURL(url, *taxonomy, kEverything);
        const auto object = TGRTIndexableContentObject::indexableContentObjectForURL(
            url, std::uint64_t{kReadMappedTaggings} | kIndexWithoutRecord);
        std::string text = url.lastPathComponent();
        for (const std::string& saying : sayingsOf(taggings)) text += " " + saying;
        for (const std::string& saying : sayingsOf(object->taggingDatas())) text += " " + saying;
        results.push_back(text + std::to_string(searching->findTagsForString(text.substr(0, 3)).size()));
    }
    return results;
}

/// Every item stores labels of its own, so many that a taxonomy grows all the time while they are read.
void storeUnknownLabels(const std::vector<URL>& items) {
    const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    int number = 0;
    for (const URL& url : items) {
        ObjectSet<TGRTTagging> taggings;
        for (int i = 0; i < 100; ++i) {
            const auto tag =
                taxonomy->findOrCreateTagWithLabel("Label " + std::to_string(++number), "Genres");
            taggings.insert(TGRTTagging::initWithTag(tag, nullptr));
        }
        const auto writer = TGRTMetaDataWriterFactory::taggingWriterForURL(url);
        Error error;
        ASSERT_TRUE(writer && writer->writeTaggings(taggings, url, &error)) << url.path() << error.message();
    }
}

TEST(Threads, TagTheSameItemsAtOnceWithAnAggregatorEach) {
    const TemporaryFolder folder;
    const std::vector<URL> items = writeDemoLibrary(folder);
    storeUnknownLabels(items);
    const auto expected = tagAll(items, *QVTaggingAggregator::independentTaggingAggregator());

    // The shared taxonomies are made while all threads ask for them.
    TGRTTaxonomy::evictCache();
    constexpr std::size_t count = 4;
    std::vector<std::vector<std::string>> results(count);
    std::vector<std::thread> threads;
    for (std::size_t i = 0; i < count; ++i) {
        threads.emplace_back(
            [&, i] { results[i] = tagAll(items, *QVTaggingAggregator::independentTaggingAggregator()); });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_THAT(results, Each(expected));
}

/// Adds the tag to what the items have, again and again: each time another file stands there.
void tagAgain(const std::vector<URL>& items, int times) {
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    const auto jazz = TGRTTagging::initWithTag(taxonomy->findTagForLabel("Jazz", "Genres"), nullptr);
    for (; times > 0; --times) {
        for (const URL& url : items) {
            Error error;
            const auto writer = TGRTMetaDataWriterFactory::taggingWriterForURL(url);
            EXPECT_TRUE(writer && writer->writeTaggings({jazz}, url, &error)) << error.message();
        }
    }
}

void indexWithNames(const std::string& folder, const std::string& database) {
    contentdb::IndexOptions options;
    options.folders = {folder};
    options.database = database;
    options.workers = 2;
    options.retryFailed = true;
    options.longestBatch = std::chrono::milliseconds(10);
    options.worker.path = QVCT_INDEX_WORKER;
    options.services = QVCTAutoTaggingOptionFilenameKeywords;
    Error error;
    EXPECT_TRUE(contentdb::indexLibrary(options, &error)) << error.message();
    // And once more in threads of the host.
    options.describer = 2;
    const auto describer = [&options] {
        return std::make_unique<contentdb::ContentDescriber>(options.services);
    };
    EXPECT_TRUE(contentdb::indexLibrary(options, describer, &error)) << error.message();
}

/// How many items it finds; opens the database anew, as a host does that was just started.
std::size_t countFound(const std::string& path, const std::string& text) {
    Error error;
    const auto database = contentdb::ContentDatabase::open(path, &error);
    EXPECT_TRUE(database) << error.message();
    if (!database) return 0;
    const auto query = contentdb::parseQuery(text, *database->vocabulary(), nullptr);
    const auto found = database->search(*query, 1000, &error);
    EXPECT_TRUE(found && database->facets(*query, &error)) << error.message();
    return found ? found->size() : 0;
}

TEST(Threads, IndexSearchAndWriteAtOnce) {
    const TemporaryFolder folder;
    const TemporaryFolder databases;
    const std::string database = databases.path("db");
    const std::vector<URL> items = writeDemoLibrary(folder);
    std::vector<URL> taken;
    for (const URL& url : items)
        if (TGRTMetaDataWriterFactory::taggingWriterForURL(url)) taken.push_back(url);
    ASSERT_GT(taken.size(), 4U);
    // Something is to be found from the start, however slow the machine is.
    tagAgain({taken[0]}, 1);
    indexWithNames(folder.path(), database);
    std::atomic<bool> isOver = false;
    std::vector<std::thread> writers;
    std::vector<std::thread> searches;
    // Both to the same files, from either end.
    for (const std::vector<URL>& order : {taken, std::vector<URL>(taken.rbegin(), taken.rend())})
        writers.emplace_back([order] { tagAgain(order, 3); });
    std::thread indexer([&] {
        for (int run = 0; run < 4; ++run) indexWithNames(folder.path(), database);
    });
    for (int i = 0; i < 2; ++i) {
        searches.emplace_back([&] {
            while (!isOver) EXPECT_GT(countFound(database, ""), 0U);
        });
    }
    for (std::thread& thread : writers) thread.join();
    indexer.join();
    isOver = true;
    for (std::thread& thread : searches) thread.join();
    indexWithNames(folder.path(), database);
    EXPECT_EQ(countFound(database, "genre:jazz"), taken.size());
    Error error;
    EXPECT_TRUE(contentdb::ContentDatabase::open(database)->check(&error)) << error.message();
}

TEST(Threads, FindTheSameAsOneByOneInTheSharedTaxonomy) {
    const TemporaryFolder folder;
    const std::vector<URL> items = writeDemoLibrary(folder);
    storeUnknownLabels(items);
    const auto aggregator = QVTaggingAggregator::defaultTaggingAggregator();
    const std::size_t before = TGRTTaxonomy::mutableDefaultTaxonomy()->allTags().size();
    const auto independent = tagAll(items, *QVTaggingAggregator::independentTaggingAggregator());
    // The independent one has left the shared taxonomy alone; the default one adds what it reads.
    EXPECT_EQ(TGRTTaxonomy::mutableDefaultTaxonomy()->allTags().size(), before);
    EXPECT_EQ(tagAll(items, *aggregator), independent);
    EXPECT_GT(TGRTTaxonomy::mutableDefaultTaxonomy()->allTags().size(), before);
}

}  // namespace
}  // namespace qvct
