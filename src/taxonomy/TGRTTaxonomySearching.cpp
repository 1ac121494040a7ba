#include "taxonomy/TGRTTaxonomySearching.h"

#include "platform/Text.h"

#include <algorithm>

namespace qvct {

std::shared_ptr<TGRTTaxonomySearching> TGRTTaxonomySearching::initWithTaxonomy(
    std::shared_ptr<TGRTTaxonomy> taxonomy) {
    std::shared_ptr<TGRTTaxonomySearching> searching(new TGRTTaxonomySearching(std::move(taxonomy)));
    searching->_updateSearchTable();
    return searching;
}

void TGRTTaxonomySearching::_updateSearchTable() {
    labels_.clear();
    tagsTable_.clear();
    if (!taxonomy_) return;
    for (const auto& tag : taxonomy_->allTags()) {
        if (tagsTable_.insert_or_assign(tag->label(), tag).second) labels_.push_back(tag->label());
    }
}

std::vector<std::string> TGRTTaxonomySearching::findTagLabelsForString(std::string_view text,
                                                                       bool exactMatch) const {
    std::vector<std::string> found;
    std::copy_if(labels_.begin(), labels_.end(), std::back_inserter(found), [&](const std::string& label) {
        return exactMatch ? label == text : containsIgnoringCaseAndDiacritics(label, text);
    });
    return found;
}

std::vector<std::shared_ptr<TGRTTag>> TGRTTaxonomySearching::findTagsForString(std::string_view text) const {
    std::vector<std::shared_ptr<TGRTTag>> tags;
    for (const std::string& label : findTagLabelsForString(text, false)) tags.push_back(tagForLabel(label));
    return tags;
}

std::shared_ptr<TGRTTag> TGRTTaxonomySearching::tagForLabel(std::string_view label) const {
    const auto hit = tagsTable_.find(std::string(label));
    return hit == tagsTable_.end() ? nullptr : hit->second;
}

}  // namespace qvct
