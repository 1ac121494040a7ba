#include "taxonomy/TaggingSetAdditions.h"

#include "taxonomy/TGRTCategory.h"

#include <algorithm>

namespace qvct {

std::shared_ptr<TGRTTagging> anyTaggingForLabel(const ObjectSet<TGRTTagging>& taggings,
                                                std::string_view label) {
    const auto hit = std::find_if(taggings.begin(), taggings.end(),
                                  [label](const auto& tagging) { return tagging->label() == label; });
    return hit == taggings.end() ? nullptr : *hit;
}

bool containsTagWithLabel(const ObjectSet<TGRTTagging>& taggings, std::string_view label) {
    return anyTaggingForLabel(taggings, label) != nullptr;
}

bool renameTagWithLabel(ObjectSet<TGRTTagging>& taggings, std::string_view label, std::string_view newLabel) {
    const auto old = label.empty() ? nullptr : anyTaggingForLabel(taggings, label);
    if (!old || normalizedTagString(newLabel).empty()) return false;
    const auto tag = TGRTTag::initWithLabel(newLabel, old->tag()->parent(), old->tag()->category());
    return reassignTagWithLabel(taggings, label, tag);
}

bool reassignTagWithLabel(ObjectSet<TGRTTagging>& taggings, std::string_view label,
                          const std::shared_ptr<TGRTTag>& tag) {
    const auto old = label.empty() ? nullptr : anyTaggingForLabel(taggings, label);
    auto tagging = old ? TGRTTagging::initWithTag(tag, old->level()) : nullptr;
    if (!tagging) return false;
    // The old one goes first: the new one may equal it.
    taggings.erase(*old);
    taggings.insert(std::move(tagging));
    return true;
}

}  // namespace qvct
