#include "taxonomy/TGRTTag.h"

#include "platform/text/Text.h"
#include "taxonomy/TGRTCategory.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

std::string labelOrNone(const std::shared_ptr<TGRTTag>& tag) {
    return tag && !tag->label().empty() ? tag->label() : "None";
}

}  // namespace

std::shared_ptr<TGRTTag> TGRTTag::initWithLabel(std::string_view rawLabel,
                                                const std::shared_ptr<TGRTTag>& parentTag,
                                                const std::shared_ptr<TGRTCategory>& category) {
    std::shared_ptr<TGRTTag> tag(new TGRTTag);
    tag->label_ = normalizedTagString(rawLabel);
    tag->valueType_ = tagValueType(rawLabel);
    if (tag->valueType_ == kTagValueBipolar || tag->valueType_ == kTagValueStepped) {
        tag->numberOfTagValueSteps_ = qvct::numberOfTagValueSteps(rawLabel);
        tag->valueStepLabels_ = tagStepLabels(rawLabel).value_or(std::vector<std::string>{});
    }
    tag->parent_ = parentTag;
    tag->hash_ = stringHash(fmt::format("{}||{}||{}", tag->label_, labelOrNone(parentTag),
                                        category ? category->identifier() : std::string{}));
    tag->category_ = category;
    if (parentTag) {
        // Of two equal children the later one stays.
        parentTag->children_.erase(*tag);
        parentTag->children_.insert(tag);
        // This tag's own category is told below.
        if (parentTag->category() != category) parentTag->tellCategory();
    }
    if (category) category->addTag(tag);
    return tag;
}

std::shared_ptr<TGRTTag> TGRTTag::initWithDictionary(const PropertyList::Dictionary& /*dictionary*/) {
    return std::shared_ptr<TGRTTag>(new TGRTTag);
}

void TGRTTag::setLabel(std::string label) {
    label_ = std::move(label);
    tellCategory();
}

std::string TGRTTag::categoryIdentifier() const {
    const auto owner = category();
    return owner ? owner->identifier() : std::string{};
}

void TGRTTag::addChild(std::shared_ptr<TGRTTag> tag) {
    if (!tag || tag.get() == this) return;
    const auto below = tag->descendants();
    const bool makesCycle =
        std::any_of(below.begin(), below.end(), [this](const auto& other) { return other.get() == this; });
    if (makesCycle) return;
    if (const auto formerParent = tag->parent()) formerParent->removeChild(tag);
    children_.insert(std::move(tag));
    tellCategory();
}

void TGRTTag::removeChild(const std::shared_ptr<TGRTTag>& tag) {
    if (!tag) return;
    children_.erase(*tag);
    tellCategory();
}

void TGRTTag::tellCategory() const {
    if (const auto owner = category()) owner->treeChanged();
}

std::vector<std::shared_ptr<TGRTTag>> TGRTTag::ancestors() const {
    std::vector<std::shared_ptr<TGRTTag>> result;
    for (auto tag = parent(); tag; tag = tag->parent()) result.push_back(tag);
    return result;
}

std::vector<std::shared_ptr<TGRTTag>> TGRTTag::descendants() const {
    std::vector<std::shared_ptr<TGRTTag>> result;
    std::vector<const TGRTTag*> pending = {this};
    while (!pending.empty()) {
        const auto& children = pending.back()->children_.ordered();
        pending.pop_back();
        result.insert(result.end(), children.begin(), children.end());
        for (auto child = children.rbegin(); child != children.rend(); ++child)
            pending.push_back(child->get());
    }
    return result;
}

std::shared_ptr<TGRTTag> TGRTTag::rootTag() {
    const auto above = ancestors();
    return above.empty() ? shared_from_this() : above.back();
}

std::string TGRTTag::serializedLabel() const {
    const std::string steps = join(valueStepLabels_, ",");
    switch (valueType_) {
        case kTagValuePercentage:
            return label_ + "%";
        case kTagValueBipolar:
            return valueStepLabels_.empty() ? label_ + "-+" : label_ + "{" + steps + "}";
        case kTagValueStepped:
            return valueStepLabels_.empty() ? fmt::format("{}${}", label_, numberOfTagValueSteps_)
                                            : label_ + "[" + steps + "]";
        case kTagValueFlag:
            return label_ + "!";
        default:
            return label_;
    }
}

PropertyList::Dictionary TGRTTag::dictionary() const {
    PropertyList::Dictionary result;
    for (const auto& child : children_) result.set(child->serializedLabel(), child->dictionary());
    return result;
}

std::shared_ptr<TGRTLevel> TGRTTag::defaultLevelForValueType(std::int64_t valueType) {
    switch (valueType) {
        case kTagValuePercentage:
        case kTagValueStepped:
        case kTagValueFlag:
            return TGRTLevel::levelWithWeight(1.0);
        case kTagValueBipolar:
            return TGRTLevel::levelWithWeight(0.0);  // neutral: neither pole
        default:
            return nullptr;
    }
}

std::int64_t TGRTTag::type() const {
    if (valueType_ == kTagValueBipolar) return 1;
    const std::string identifier = categoryIdentifier();
    const bool isFlag = valueType_ == kTagValueFlag || identifier == QVCategorySoundpackIdentifier ||
                        identifier == QVCategoryContentTypeIdentifier;
    return isFlag ? 2 : 0;
}

std::optional<std::string> TGRTTag::packageIdentifier() const {
    if (categoryIdentifier() != QVCategorySoundpackIdentifier) return std::nullopt;
    std::string identifier = lowercase(replaceNonAlphanumerics(trimBlanksAndLineBreaks(label_), "_", "_"));
    while (identifier.find("__") != std::string::npos) identifier = replaceAll(identifier, "__", "_");
    return identifier;
}

bool TGRTTag::isEqual(const Object& other) const {
    return dynamic_cast<const TGRTTag*>(&other) != nullptr && other.hash() == hash();
}

std::string TGRTTag::description() const {
    return fmt::format("<TGRTTag {}> label: {} parentTag: {} category: {}", static_cast<const void*>(this),
                       label_, labelOrNone(parent()), category() ? categoryIdentifier() : "(null)");
}

}  // namespace qvct
