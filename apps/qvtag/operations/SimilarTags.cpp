#include "operations/SimilarTags.h"

#include "platform/text/Spelling.h"
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

namespace {

std::string nameOf(const TGRTTag& tag) {
    return fmt::format("{}/{}", tag.categoryIdentifier(), tag.label());
}

std::string nearestTag(std::string_view label, const TGRTTaxonomy& taxonomy) {
    const auto tags = taxonomy.allTags();
    std::vector<std::string> labels;
    labels.reserve(tags.size());
    for (const auto& tag : tags) labels.push_back(tag->label());
    const std::string_view nearest = nearestSpelling(label, labels);
    const auto tag = nearest.empty() ? nullptr : taxonomy.findTagForLabel(nearest);
    return tag ? fmt::format("; did you mean \"{}\"?", nameOf(*tag)) : std::string();
}

}  // namespace

std::string similarTags(std::string_view label, const std::shared_ptr<TGRTTaxonomy>& taxonomy) {
    std::vector<std::string> names;
    for (const auto& tag : tagsHolding(label, taxonomy)) {
        std::string name = nameOf(*tag);
        if (std::find(names.begin(), names.end(), name) == names.end()) names.push_back(std::move(name));
    }
    return names.empty() ? nearestTag(label, *taxonomy) : "; there are: " + join(names, ", ");
}

}  // namespace qvct::tool
