#include "SimilarTags.h"

#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomySearching.h"

#include <algorithm>
#include <unordered_set>

#include <fmt/format.h>

namespace qvct::tool {

std::vector<std::shared_ptr<TGRTTag>> tagsHolding(std::string_view text,
                                                  const std::shared_ptr<TGRTTaxonomy>& taxonomy) {
    // The table of the search has one tag a label; a label may stand in several places.
    const auto labels =
        TGRTTaxonomySearching::initWithTaxonomy(taxonomy)->findTagLabelsForString(text, false);
    const std::unordered_set<std::string_view> wanted(labels.begin(), labels.end());
    auto tags = taxonomy->allTags();
    std::erase_if(tags, [&wanted](const auto& tag) { return !wanted.contains(tag->label()); });
    return tags;
}

std::string similarTags(std::string_view label, const std::shared_ptr<TGRTTaxonomy>& taxonomy) {
    std::vector<std::string> names;
    for (const auto& tag : tagsHolding(label, taxonomy)) {
        std::string name = fmt::format("{}/{}", tag->categoryIdentifier(), tag->label());
        if (std::find(names.begin(), names.end(), name) == names.end()) names.push_back(std::move(name));
    }
    return names.empty() ? "" : "; there are: " + join(names, ", ");
}

}  // namespace qvct::tool
