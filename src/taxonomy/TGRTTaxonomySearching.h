#pragma once

#include "platform/base/Export.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

namespace qvct {

/// Finds tags by what a user types, for suggestions.
class QVCT_API TGRTTaxonomySearching {
  public:
    /// Labels with their tags, each label once.
    using TagsTable = std::vector<std::pair<std::string, std::shared_ptr<TGRTTag>>>;

    /// Without a taxonomy it finds nothing. The table is made once; after adding tags to the taxonomy, call
    /// `_updateSearchTable`.
    static std::shared_ptr<TGRTTaxonomySearching> initWithTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy);
    /// Rebuilds the table from the taxonomy: its labels in its order; of several tags with one label the last
    /// counts. Empty without a taxonomy.
    void _updateSearchTable();

    /// The labels equal to the text, or (not exact) those that hold it, without regard to case and
    /// diacritics. In the order of the table.
    std::vector<std::string> findTagLabelsForString(std::string_view text, bool exactMatch) const;
    /// The tags of the labels that hold the text.
    std::vector<std::shared_ptr<TGRTTag>> findTagsForString(std::string_view text) const;

    const std::shared_ptr<TGRTTaxonomy>& taxonomy() const { return taxonomy_; }
    /// The table stays as it is.
    void setTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy) { taxonomy_ = std::move(taxonomy); }
    /// What is searched.
    const TagsTable& tagsTable() const { return tagsTable_; }
    /// Searches these tags from now on. Of several rows with one label the tag of the last counts, in the
    /// place of the first.
    void setTagsTable(const TagsTable& table);
    /// The tag of the table with that label, or null.
    std::shared_ptr<TGRTTag> tagForLabel(std::string_view label) const;

  private:
    explicit TGRTTaxonomySearching(std::shared_ptr<TGRTTaxonomy> taxonomy) : taxonomy_(std::move(taxonomy)) {}

    std::shared_ptr<TGRTTaxonomy> taxonomy_;
    TagsTable tagsTable_;
    std::unordered_map<std::string, std::size_t> rowOfLabel_;
};

}  // namespace qvct
