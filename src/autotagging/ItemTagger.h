#pragma once

#include "autotagging/evidence/ClaimResolver.h"
#include "autotagging/evidence/Rejections.h"
#include "autotagging/names/ItemNames.h"
#include "formats/library/FolderRejections.h"
#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"

#include <cstdint>
#include <memory>
#include <optional>

namespace qvct {

class ContentItem;
struct HeardSound;
class NameReader;
class QVTaggingAggregator;
class TGRTTagging;
class TGRTTaxonomy;

/// What an item is, as far as it can be told, and why.
struct QVCT_API ItemReport {
    Resolution resolution;
    std::optional<double> tempo;  ///< Beats a minute that its names state.
    /// In all, as its names state them; a bar counts four.
    std::optional<int> beats;
    /// The tempo is a bare number in its name, which holds since the sound is `beats` long at it.
    bool isTempoFromLength = false;
    SoundKind kind = SoundKind::unsaid;
    std::shared_ptr<const HeardSound> sound;  ///< Null if nobody listened, or nothing could be decoded.
    /// What a person rejected for the item; `resolution` is without it. A host holds its own tags against it.
    Rejections rejections;

    /// The tags that hold, marked as automatic.
    ObjectSet<TGRTTagging> taggings() const;
    /// Those that a person did not reject; the others are added to what does not hold.
    ObjectSet<TGRTTagging> withoutRejected(const ObjectSet<TGRTTagging>& stored);
};

/// Tags items as a person would: weighs what the services claim, lets what stands in an item's own name
/// outweigh what its folders say, and decides between tags that exclude each other. What a person rejected,
/// for the item or for a folder whose name counts, it does not say again.
///
/// What folders reject is read once: make a new one for each run. Use one from one thread at a time, like its
/// aggregator.
class QVCT_API ItemTagger {
  public:
    /// Labels are resolved in that taxonomy.
    ItemTagger(std::shared_ptr<QVTaggingAggregator> aggregator, std::shared_ptr<const TGRTTaxonomy> taxonomy);

    ItemTagger(const ItemTagger&) = delete;
    ItemTagger& operator=(const ItemTagger&) = delete;
    ~ItemTagger();

    /// `options`: the services that are asked, a sum of QVCTAutoTaggingOptions.
    ItemReport report(const std::shared_ptr<ContentItem>& item, const ItemNames& names,
                      std::uint64_t options);

    /// What names alone tell, without a look at the item, for all that it needs not exist, nor at what is
    /// rejected. `otherwise`: what it is where they do not say.
    ItemReport reportOfNames(const ItemNames& names, SoundKind otherwise);

  private:
    NameReader& reader();
    Rejections rejectionsOf(ContentItem& item, const ItemNames& names);
    void reject(std::vector<TagClaim>& claims, const Rejections& rejections) const;

    std::shared_ptr<QVTaggingAggregator> aggregator_;
    std::shared_ptr<const TGRTTaxonomy> taxonomy_;
    ClaimResolver resolver_;
    FolderRejections folders_;
    std::unique_ptr<NameReader> reader_;  // made when names are asked for
};

}  // namespace qvct
