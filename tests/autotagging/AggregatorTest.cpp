#include "autotagging/QVTaggingAggregator.h"

#include <gmock/gmock.h>

namespace qvct {
namespace {

/// Answers what the test says, whatever it is asked.
class FixedService : public QVCTAutoTaggingService {
  public:
    explicit FixedService(std::vector<TagDictionary> tags) : tags_(std::move(tags)) {}
    TagDictionarySet tagsWithContentsOfURL(const URL& /*url*/,
                                           const std::shared_ptr<QVCTXMLDocument>& /*xml*/,
                                           const std::shared_ptr<TGRTMetaData>& /*metaData*/,
                                           const std::shared_ptr<LCFileData>& /*fileData*/,
                                           std::uint64_t /*options*/) override {
        TagDictionarySet set;
        for (const auto& tag : tags_) set.insert(tag);
        return set;
    }

  private:
    std::vector<TagDictionary> tags_;
};

class AggregatorOf : public QVTaggingAggregator {
  public:
    explicit AggregatorOf(Services services) : QVTaggingAggregator(std::move(services)) {}
};

TEST(Aggregator, UnitesDictionariesAndFoldsThemIntoTaggings) {
    using Tags = std::vector<TagDictionary>;
    AggregatorOf aggregator(
        {std::make_shared<FixedService>(Tags{{{"label", "Mono"}}, {{"label", "House"}, {"level", "0.5"}}}),
         std::make_shared<FixedService>(Tags{{{"label", "Mono"}},
                                             {{"label", "Mono"}, {"level", 0.5}},
                                             {{"level", 0.5}, {"label", "Mono"}},
                                             {{"label", "House"}, {"level", PropertyList::Array{}}},
                                             {{"label", "no such label"}},
                                             {{"label", 7}},
                                             {{"level", 1}}})});
    const URL url = URL::fileURLWithPath("/x.caf");
    EXPECT_EQ(aggregator.tagsWithContentsOfURL(url, 0).size(), 7U);
    std::vector<std::string> taggings;
    for (const auto& tagging :
         aggregator.taggingsWithContentsOfURL(url, *TGRTTaxonomy::defaultTaxonomy(), 0)) {
        taggings.push_back(tagging->label() +
                           (tagging->level() ? std::to_string(tagging->level()->weight()) : ""));
        EXPECT_TRUE(tagging->isAutoTagging());
    }
    EXPECT_THAT(taggings, testing::ElementsAre("Mono", "House0.500000", "Mono0.500000", "House"));
}

TEST(Aggregator, WithoutOptionsSaysNothing) {
    const auto aggregator = QVTaggingAggregator::defaultTaggingAggregator();
    EXPECT_EQ(aggregator->taxonomy(), TGRTTaxonomy::defaultTaxonomy());
    const URL url = URL::fileURLWithPath("/Drums/Kick.wav");
    EXPECT_TRUE(aggregator->tagsWithContentsOfURL(url, 0).empty());
    EXPECT_FALSE(aggregator->tagsWithContentsOfURL(url, QVCTAutoTaggingOptionFilenameKeywords).empty());
}

}  // namespace
}  // namespace qvct
