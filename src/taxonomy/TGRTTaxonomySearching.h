#pragma once

#include "platform/Export.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace qvct {

/// Finds tags by what a user types, for suggestions.
class QVCT_API TGRTTaxonomySearching {
  public:
    /// Without a taxonomy it finds nothing. The table is made once; after adding tags to the taxonomy, make
    /// it anew with `_updateSearchTable`.
    static std::shared_ptr<TGRTTaxonomySearching> initWithTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy);
    /// Makes the table anew from the taxonomy. Empty without one.
    void _updateSearchTable();

    /// The labels equal to the text, or (not exact) those that hold it, without regard to case and
    /// diacritics. In the order of the taxonomy, each once.
    std::vector<std::string> findTagLabelsForString(std::string_view text, bool exactMatch) const;
    /// The tags of the labels that hold the text; of several tags with one label the last.
    std::vector<std::shared_ptr<TGRTTag>> findTagsForString(std::string_view text) const;

    const std::shared_ptr<TGRTTaxonomy>& taxonomy() const { return taxonomy_; }
    void setTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy) { taxonomy_ = std::move(taxonomy); }
    /// The tag of the table with that label, or null.
    std::shared_ptr<TGRTTag> tagForLabel(std::string_view label) const;

  private:
    explicit TGRTTaxonomySearching(std::shared_ptr<TGRTTaxonomy> taxonomy) : taxonomy_(std::move(taxonomy)) {}

    std::shared_ptr<TGRTTaxonomy> taxonomy_;
    std::vector<std::string> labels_;
    std::unordered_map<std::string, std::shared_ptr<TGRTTag>> tagsTable_;
};

}  // namespace qvct
