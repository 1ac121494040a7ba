#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"
#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace qvct {

class ContentItem;

/// Derives tags for content items: asks every tagging service that the options name and merges their answers.
///
/// Nothing is kept between calls but what the services cache. Use an aggregator from one thread at a time:
/// the keyword service requires it, and records are read in the shared writable default taxonomy, to which
/// they may add labels. Threads that work at the same time each need an `independentTaggingAggregator`.
class QVCT_API QVTaggingAggregator {
  public:
    using Services = std::vector<std::shared_ptr<QVCTAutoTaggingService>>;
    using Settings = std::optional<PropertyList::Dictionary>;

    /// With the built-in rules and keywords, for the default taxonomy.
    static std::shared_ptr<QVTaggingAggregator> defaultTaggingAggregator();
    /// The same with a writable copy of the default taxonomy of its own, in which it reads records: it
    /// changes nothing that others share.
    static std::shared_ptr<QVTaggingAggregator> independentTaggingAggregator();
    /// With rules and keywords of the host's own; an argument without value stands for the built-in ones.
    static std::shared_ptr<QVTaggingAggregator> initWithRules(Settings rules, Settings keywordMapping);
    /// The services of such an aggregator, in the order in which it asks them. A subclass can pass them on
    /// together with services of the host's own.
    static Services defaultTaggingServicesWithRules(Settings rules, Settings keywordMapping);

    virtual ~QVTaggingAggregator() = default;

    /// What the services say: each tag dictionary once. Labels need not be known to any taxonomy.
    TagDictionarySet tagsWithContentsOfURL(const URL& url, std::uint64_t options);
    /// The same for an item of which parts may have been read already. Its record is used as it was read,
    /// whatever the options.
    TagDictionarySet tagsOfItem(const std::shared_ptr<ContentItem>& item, std::uint64_t options);
    /// The same as taggings. Labels that the taxonomy does not know are dropped.
    ObjectSet<TGRTTagging> taggingsWithContentsOfURL(const URL& url, const TGRTTaxonomy& taxonomy,
                                                     std::uint64_t options);
    /// What `tagsOfItem` answers, as taggings.
    ObjectSet<TGRTTagging> taggingsOfItem(const std::shared_ptr<ContentItem>& item,
                                          const TGRTTaxonomy& taxonomy, std::uint64_t options);

    /// What each service claims, and what speaks for it. `names`: the item's own, its folder's and so on, see
    /// `ItemNames`.
    std::vector<TagClaim> claimsOfItem(const std::shared_ptr<ContentItem>& item,
                                       std::span<const std::string_view> names, std::uint64_t options);

    /// The taxonomy that belongs to this aggregator. Conversion uses the one it is given.
    const std::shared_ptr<TGRTTaxonomy>& taxonomy() const { return taxonomy_; }
    void setTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy) { taxonomy_ = std::move(taxonomy); }

    // What the services are given of an item: prepared once for each call, and null where the item has none.
    // A host that already has one of these overrides the operation. During a call the base class answers from
    // the item that is being tagged, so that no file is opened twice.

    /// The XML description in or beside the item.
    virtual std::shared_ptr<QVCTXMLDocument> xmlDocumentForURL(const URL& url);
    /// The stored record. `options` are MetaDataReaderOptions.
    virtual std::shared_ptr<TGRTMetaData> metaDataForURL(const URL& url, std::uint64_t options);
    /// What the chunks of an audio file say. The type is opaque to hosts: pass on what the base class
    /// answers.
    virtual std::shared_ptr<LCFileData> fileDataForURL(const URL& url);

  protected:
    /// Null services are left out.
    explicit QVTaggingAggregator(Services services);

  private:
    bool readsInItsTaxonomy_ = false;  // records, else in the shared writable default taxonomy
    /// The item at hand, or one for another URL.
    std::shared_ptr<ContentItem> itemForURL(const URL& url, std::uint64_t options) const;

    Services taggingServices_;
    std::shared_ptr<TGRTTaxonomy> taxonomy_;
    std::shared_ptr<ContentItem> item_;  // during a call, the one at hand
};

}  // namespace qvct
