#include "taxonomy/TGRTTaxonomySearching.h"

#include "platform/text/Text.h"

namespace qvct {

std::shared_ptr<TGRTTaxonomySearching> TGRTTaxonomySearching::initWithTaxonomy(
    std::shared_ptr<TGRTTaxonomy> taxonomy) {
    std::shared_ptr<TGRTTaxonomySearching> searching(new TGRTTaxonomySearching(std::move(taxonomy)));
    searching->_updateSearchTable();
    return searching;
}

void TGRTTaxonomySearching::_updateSearchTable() {
    TagsTable table;
    if (taxonomy_) {
        for (const auto& tag : taxonomy_->allTags()) table.emplace_back(tag->label(), tag);
    }
    setTagsTable(table);
}

void TGRTTaxonomySearching::setTagsTable(const TagsTable& table) {
    TagsTable rows;
    rowOfLabel_.clear();
    for (const auto& [label, tag] : table) {
        const auto [row, isNew] = rowOfLabel_.try_emplace(label, rows.size());
        if (isNew) {
            rows.emplace_back(label, tag);
        } else {
            rows[row->second].second = tag;
        }
    }
    tagsTable_ = std::move(rows);
}

std::vector<std::string> TGRTTaxonomySearching::findTagLabelsForString(std::string_view text,
                                                                       bool exactMatch) const {
    std::vector<std::string> found;
    for (const auto& [label, _] : tagsTable_) {
        if (exactMatch ? label == text : containsIgnoringCaseAndDiacritics(label, text))
            found.push_back(label);
    }
    return found;
}

std::vector<std::shared_ptr<TGRTTag>> TGRTTaxonomySearching::findTagsForString(std::string_view text) const {
    std::vector<std::shared_ptr<TGRTTag>> tags;
    for (const std::string& label : findTagLabelsForString(text, false)) tags.push_back(tagForLabel(label));
    return tags;
}

std::shared_ptr<TGRTTag> TGRTTaxonomySearching::tagForLabel(std::string_view label) const {
    const auto hit = rowOfLabel_.find(std::string(label));
    return hit == rowOfLabel_.end() ? nullptr : tagsTable_[hit->second].second;
}

}  // namespace qvct
