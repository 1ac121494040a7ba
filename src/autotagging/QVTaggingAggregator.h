#pragma once

#include "autotagging/QVCTAutoTaggingService.h"
#include "platform/Export.h"
#include "platform/ObjectSet.h"
#include "platform/PropertyList.h"
#include "platform/Url.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <vector>

namespace qvct {

/// Derives tags for content items: asks every tagging service that the options name and merges their answers.
///
/// Nothing is kept between calls but what the services cache. The keyword service works from one thread at a
/// time, so give each thread an aggregator of its own.
class QVCT_API QVTaggingAggregator {
  public:
    using Services = std::vector<std::shared_ptr<QVCTAutoTaggingService>>;
    using Settings = std::optional<PropertyList::Dictionary>;

    /// With the built-in rules and keywords, for the default taxonomy.
    static std::shared_ptr<QVTaggingAggregator> defaultTaggingAggregator();
    /// With rules and keywords of the host's own; nothing stands for the built-in ones.
    static std::shared_ptr<QVTaggingAggregator> initWithRules(Settings rules, Settings keywordMapping);
    static Services defaultTaggingServicesWithRules(Settings rules, Settings keywordMapping);

    virtual ~QVTaggingAggregator() = default;

    /// What the services say: each tag dictionary once. Labels need not be known to any taxonomy.
    TagDictionarySet tagsWithContentsOfURL(const URL& url, std::uint64_t options);
    /// The same as taggings. Labels that the taxonomy does not know are dropped.
    ObjectSet<TGRTTagging> taggingsWithContentsOfURL(const URL& url, const TGRTTaxonomy& taxonomy,
                                                     std::uint64_t options);

    /// The taxonomy that belongs to this aggregator. Conversion uses the one it is given.
    const std::shared_ptr<TGRTTaxonomy>& taxonomy() const { return taxonomy_; }
    void setTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy) { taxonomy_ = std::move(taxonomy); }

    // What the services are given of an item: prepared once a call, each null where the item has none. A host
    // that has one at hand overrides.

    virtual std::shared_ptr<QVCTXMLDocument> xmlDocumentForURL(const URL& url);
    virtual std::shared_ptr<TGRTMetaData> metaDataForURL(const URL& url, std::uint64_t options);
    virtual std::shared_ptr<LCFileData> fileDataForURL(const URL& url);

  protected:
    explicit QVTaggingAggregator(Services services) : taggingServices_(std::move(services)) {}

  private:
    Services taggingServices_;
    std::shared_ptr<TGRTTaxonomy> taxonomy_;
};

}  // namespace qvct
