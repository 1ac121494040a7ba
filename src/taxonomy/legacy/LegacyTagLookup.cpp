#include "taxonomy/legacy/LegacyTagLookup.h"

namespace qvct {

std::shared_ptr<TGRTTag> findLegacyTag(const TGRTTaxonomy& taxonomy, std::string_view label,
                                       std::string_view parentLabel, std::string_view categoryIdentifier) {
    if (!parentLabel.empty()) return taxonomy.findTagForLabel(label, parentLabel, categoryIdentifier);
    const auto category = taxonomy.findCategoryWithIdentifier(categoryIdentifier);
    if (!category) return nullptr;
    for (const auto& tag : category->tags()) {
        if (!tag->parent() && tag->label() == label) return tag;
    }
    return taxonomy.findTagForLabel(label, categoryIdentifier);
}

}  // namespace qvct
