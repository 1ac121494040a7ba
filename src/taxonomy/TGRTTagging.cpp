#include "taxonomy/TGRTTagging.h"

#include "platform/text/DecimalFormatter.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <tuple>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

std::string levelText(float weight) {
    static const DecimalFormatter wholeNumbers(0);
    constexpr std::array levels = {kTaggingLevel1, kTaggingLevel2, kTaggingLevel3, kTaggingLevel4};
    for (std::size_t i = 0; i < levels.size(); ++i) {
        if (weight == levels[i]) return wholeNumbers.stringFromNumber(static_cast<double>(i + 1));
    }
    return TGRTTagging::doubleFormatter().stringFromNumber(static_cast<double>(weight) * 4.0);
}

std::size_t hashOf(std::string_view label, const TGRTLevel* level, std::string_view category) {
    fmt::memory_buffer text;
    fmt::format_to(std::back_inserter(text), "<TGRTTagging>N:{} L:{} C:{}", label,
                   static_cast<std::int64_t>(level == nullptr ? 0 : level->hash()), category);
    return stringHash({text.data(), text.size()});
}

/// The tagging that one entry of a tagging dictionary describes, or null.
std::shared_ptr<TGRTTagging> taggingForEntry(const PropertyList& entry, std::string_view categoryIdentifier,
                                             TGRTTaxonomy& taxonomy) {
    const auto* fields = entry.dictionary();
    const auto* name = fields == nullptr ? nullptr : fields->value(QVContentTaggingLabelKeyName);
    const std::string* label = name == nullptr ? nullptr : name->string();
    if (label == nullptr || label->empty()) return nullptr;
    const auto* weight = fields->value(QVContentTaggingWeightKeyName);
    const std::optional<double> number = weight == nullptr ? std::nullopt : weight->doubleValue();
    auto tagging = TGRTTagging::initWithTag(taxonomy.findOrCreateTagWithLabel(*label, categoryIdentifier),
                                            number ? TGRTLevel::levelWithWeight(*number) : nullptr);
    const auto* automatic = fields->value(QVContentTaggingAutoTaggingKeyName);
    if (tagging) tagging->setIsAutoTagging(automatic != nullptr && automatic->boolValue());
    return tagging;
}

PropertyList::Dictionary entryForTagging(const TGRTTagging& tagging) {
    PropertyList::Dictionary entry{{std::string(QVContentTaggingLabelKeyName), tagging.label()}};
    if (tagging.level()) entry.set(QVContentTaggingWeightKeyName, tagging.level()->weight());
    if (tagging.isAutoTagging()) entry.set(QVContentTaggingAutoTaggingKeyName, true);
    return entry;
}

}  // namespace

TGRTTagging::TGRTTagging(std::shared_ptr<TGRTTag> tag, std::shared_ptr<TGRTLevel> level)
    : tag_(std::move(tag)),
      level_(std::move(level)),
      label_(tag_->label()),
      category_(tag_->categoryIdentifier()),
      hash_(hashOf(label_, level_.get(), category_)) {
    if (const auto parent = tag_->parent()) parentLabel_ = parent->label();
}

std::shared_ptr<TGRTTagging> TGRTTagging::initWithTag(std::shared_ptr<TGRTTag> tag,
                                                      std::shared_ptr<TGRTLevel> level) {
    if (!tag || tag->label().empty()) return nullptr;
    return std::shared_ptr<TGRTTagging>(new TGRTTagging(std::move(tag), std::move(level)));
}

float TGRTTagging::weight() const {
    const auto level = level_ ? level_ : tag_->defaultLevel();
    return level ? static_cast<float>(level->weight()) : 1.0F;
}

std::int64_t TGRTTagging::weightLevel() const {
    return std::lround(weight() * 10.0F);
}

const DecimalFormatter& TGRTTagging::doubleFormatter() {
    static const DecimalFormatter formatter(1);
    return formatter;
}

std::string TGRTTagging::displayString() const {
    return level_ ? fmt::format("{} ({})", label_, levelText(weight())) : tag_->label();
}

ObjectSet<TGRTTagging> TGRTTagging::taggingsWithTaggingDictionary(const PropertyList* dictionary,
                                                                  TGRTTaxonomy& taxonomy) {
    const bool holdsTaggings = dictionary != nullptr && dictionary->dictionary() != nullptr;
    return holdsTaggings ? taggingsWithTaggingDictionary(*dictionary->dictionary(), taxonomy)
                         : ObjectSet<TGRTTagging>{};
}

ObjectSet<TGRTTagging> TGRTTagging::taggingsWithTaggingDictionary(const PropertyList::Dictionary& dictionary,
                                                                  TGRTTaxonomy& taxonomy) {
    ObjectSet<TGRTTagging> taggings;
    for (const auto& category : dictionary) {
        if (category.value.array() == nullptr) continue;
        for (const PropertyList& entry : *category.value.array()) {
            taggings.insert(taggingForEntry(entry, category.key, taxonomy));
        }
    }
    return taggings;
}

ObjectSet<TGRTTagging> TGRTTagging::taggingsWithTaggingDictionary(const PropertyList* dictionary) {
    return taggingsWithTaggingDictionary(dictionary, *TGRTTaxonomy::mutableDefaultTaxonomy());
}

ObjectSet<TGRTTagging> TGRTTagging::taggingsWithTaggingDictionary(
    const PropertyList::Dictionary& dictionary) {
    return taggingsWithTaggingDictionary(dictionary, *TGRTTaxonomy::mutableDefaultTaxonomy());
}

PropertyList::Dictionary TGRTTagging::taggingDictionaryForTaggings(const ObjectSet<TGRTTagging>& taggings) {
    return taggingDictionaryForTaggings(taggings.ordered());
}

PropertyList::Dictionary TGRTTagging::taggingDictionaryForTaggings(
    std::vector<std::shared_ptr<TGRTTagging>> taggings) {
    std::erase(taggings, nullptr);
    std::stable_sort(taggings.begin(), taggings.end(), [](const auto& a, const auto& b) {
        return std::tie(a->category_, a->label_) < std::tie(b->category_, b->label_);
    });
    PropertyList::Dictionary result;
    for (auto first = taggings.begin(); first != taggings.end();) {
        const std::string& category = (*first)->category_;
        PropertyList::Array entries;
        for (; first != taggings.end() && (*first)->category_ == category; ++first) {
            entries.emplace_back(entryForTagging(**first));
        }
        result.append(category, std::move(entries));
    }
    return result;
}

bool TGRTTagging::isEqual(const Object& other) const {
    return dynamic_cast<const TGRTTagging*>(&other) != nullptr && other.hash() == hash();
}

std::string TGRTTagging::description() const {
    return fmt::format("<TGRTTagging {}> Name: {} Level: {} Category: {}", static_cast<const void*>(this),
                       label_, level_ ? level_->description() : "(null)", category_);
}

}  // namespace qvct
