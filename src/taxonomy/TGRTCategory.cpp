#include "taxonomy/TGRTCategory.h"

#include "taxonomy/TGRTTag.h"
#include "taxonomy/labels/LabelIndex.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

namespace qvct {

TGRTCategory::TGRTCategory(std::string identifier)
    : identifier_(std::move(identifier)),
      hash_(stringHash(identifier_)),
      index_(std::make_unique<LabelIndex>()) {}

TGRTCategory::~TGRTCategory() = default;

std::shared_ptr<TGRTCategory> TGRTCategory::initWithIdentifier(std::string identifier) {
    return std::shared_ptr<TGRTCategory>(new TGRTCategory(std::move(identifier)));
}

void TGRTCategory::setIdentifier(std::string identifier) {
    anyWasRenamed_ = true;
    identifier_ = std::move(identifier);
}

void TGRTCategory::addTag(const std::shared_ptr<TGRTTag>& tag) {
    if (!tag) return;
    // Adding a root tag that equals an existing one changes nothing.
    if (!tag->parent() && tag->children().empty() && tags_.contains(*tag)) return;
    const auto parent = tag->parent();
    const bool isOfThisTree = tag->category().get() == this && (!parent || parent->category().get() == this);
    // A tag that equals another one can only be found below its own parent; a tag from elsewhere brings a
    // subtree along, which may grow without this category noticing.
    if (!tags_.insert(tag) || !isOfThisTree || !tag->children().empty()) return treeChanged();
    index_->add(*tag, tag->label());
}

void TGRTCategory::removeTag(const std::shared_ptr<TGRTTag>& tag) {
    if (!tag) return;
    tags_.erase(*tag);
    treeChanged();
}

void TGRTCategory::treeChanged() {
    index_->treeChanged();
}

bool TGRTCategory::doesContain(const TGRTTag& tag) const {
    return tags_.contains(tag);
}

ObjectSet<TGRTTag> TGRTCategory::rootTags() const {
    ObjectSet<TGRTTag> roots;
    for (const auto& tag : tags_) {
        if (!tag->parent()) roots.insert(tag);
    }
    return roots;
}

int TGRTCategory::compareTag(const TGRTTag& a, const TGRTTag& b) const {
    const auto index = [this](const TGRTTag& tag) {
        return std::find_if(tags_.begin(), tags_.end(),
                            [&tag](const auto& member) { return member->isEqual(tag); });
    };
    return index(a) > index(b) ? 1 : -1;
}

PropertyList::Dictionary TGRTCategory::dictionary() const {
    PropertyList::Dictionary result;
    for (const auto& tag : rootTags()) result.set(tag->serializedLabel(), tag->dictionary());
    return result;
}

bool TGRTCategory::isEqual(const Object& other) const {
    return dynamic_cast<const TGRTCategory*>(&other) != nullptr && other.hash() == hash();
}

std::string TGRTCategory::description() const {
    std::string tagLines = "\n";
    for (const auto& tag : tags_) tagLines += tag->description() + "\n";
    return fmt::format("<TGRTCategory {}> identifier: {} tags:{}", static_cast<const void*>(this),
                       identifier_, tagLines);
}

}  // namespace qvct
