#include "taxonomy/TGRTTaxonomy.h"

#include "platform/base/EvictableCache.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"
#include "resources/LegacyMappingTable.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TaggingTypes.h"
#include "taxonomy/TaxonomyLocalization.h"
#include "taxonomy/labels/LabelIndex.h"

#include <algorithm>
#include <array>
#include <unordered_map>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kCategoriesKey = "categories";

EvictableCache<TGRTTaxonomy>& sharedCache() {
    static EvictableCache<TGRTTaxonomy> cache;
    return cache;
}

bool hasParentLabel(const TGRTTag& tag, TGRTTaxonomy::OptionalLabel wanted) {
    if (!wanted) return true;
    const auto parent = tag.parent();
    return parent && parent->label() == *wanted;
}

/// A tag of a property list that is still to be made, with what lies below it.
struct TagToCreate {
    std::string label;
    const PropertyList* value;
    TGRTTaxonomy::TagPointer parent;
};

/// Puts the entries on top, the first sibling last.
void pushSiblings(const PropertyList::Dictionary& dictionary, const TGRTTaxonomy::TagPointer& parent,
                  std::vector<TagToCreate>& pending) {
    std::vector<std::string> labels;
    std::unordered_map<std::string_view, const PropertyList*> values;
    for (const auto& [label, value] : dictionary) {
        labels.push_back(label);
        values.try_emplace(label, &value);
    }
    labels = TGRTTaxonomy::sortedTagLabelsFromArray(std::move(labels));
    for (auto label = labels.rbegin(); label != labels.rend(); ++label) {
        const PropertyList* value = values.at(*label);
        pending.push_back({std::move(*label), value, parent});
    }
}

}  // namespace

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::init() {
    return std::shared_ptr<TGRTTaxonomy>(new TGRTTaxonomy);
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::defaultTaxonomy() {
    return newTaxonomyOfType(kDefaultTaxonomy, true, true);
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::mutableDefaultTaxonomy() {
    return newTaxonomyOfType(kDefaultTaxonomy, false, true);
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::testingTaxonomy() {
    return newTaxonomyOfType(kDefaultTaxonomy, false, false);
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::legacyVorthalTaxonomy() {
    return newTaxonomyOfType(kLegacyVorthalTaxonomy, true, true);
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::legacyLoopTaxonomy() {
    return newTaxonomyOfType(kLegacyLoopTaxonomy, true, true);
}

void TGRTTaxonomy::evictCache() {
    sharedCache().removeAllObjects();
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::newTaxonomyOfType(std::int64_t type, bool readonly,
                                                              bool useCache) {
    const std::string key = fmt::format("key:{}-{}", type, readonly ? 1 : 0);
    if (useCache) {
        if (auto cached = sharedCache().objectForKey(key)) return cached;
    }
    const std::optional<URL> url = taxonomyURLForType(type);
    auto dictionary = url ? readDictionaryFile(url->path()) : std::nullopt;
    if (!dictionary) dictionary = taxonomyDictionaryForType(type);
    auto taxonomy = taxonomyWithDictionary(std::move(dictionary).value_or(PropertyList::Dictionary{}));
    taxonomy->setReadOnly(readonly);
    return useCache ? sharedCache().addObject(key, std::move(taxonomy)) : taxonomy;
}

std::optional<URL> TGRTTaxonomy::taxonomyURLForType(std::int64_t type) {
    constexpr std::array names = {"DefaultTaxonomy", "LegacyVorthalTaxonomy", "LegacyLoopTaxonomy"};
    if (type > kDefaultTaxonomy || type < kLegacyLoopTaxonomy) return std::nullopt;
    const auto path = replacementFile({names[static_cast<std::size_t>(-type)], "plist"});
    return path ? std::optional(URL::fileURLWithPath(*path)) : std::nullopt;
}

std::optional<PropertyList::Dictionary> TGRTTaxonomy::taxonomyDictionaryForType(std::int64_t type) {
    switch (type) {
        case kDefaultTaxonomy:
            return QVCTCompiledResources::DefaultTaxonomyPlist();
        case kLegacyVorthalTaxonomy:
            return QVCTCompiledResources::LegacyVorthalTaxonomyPlist();
        case kLegacyLoopTaxonomy:
            return QVCTCompiledResources::LegacyLoopTaxonomyPlist();
        default:
            return std::nullopt;
    }
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::taxonomyWithContentsOfURL(const URL& url, Error* error) {
    return taxonomyWithDictionary(readDictionaryFile(url.path(), error).value_or(PropertyList::Dictionary{}));
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::taxonomyWithData(std::span<const std::uint8_t> data,
                                                             Error* error) {
    const auto list = parsePropertyList(data, error);
    return list && list->dictionary() != nullptr ? taxonomyWithDictionary(*list->dictionary()) : nullptr;
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::taxonomyWithData(std::string_view data, Error* error) {
    return taxonomyWithData(std::span(reinterpret_cast<const std::uint8_t*>(data.data()), data.size()),
                            error);
}

std::shared_ptr<TGRTTaxonomy> TGRTTaxonomy::taxonomyWithDictionary(
    const PropertyList::Dictionary& dictionary) {
    auto taxonomy = init();
    const PropertyList::Dictionary* categories = dictionary.dictionary(kCategoriesKey);
    if (categories == nullptr) return taxonomy;
    for (const auto& entry : *categories) {
        const auto category = TGRTCategory::initWithIdentifier(entry.key);
        taxonomy->addCategory(category);
        if (const auto* tags = entry.value.dictionary()) tagsFromDictionary(*tags, nullptr, category);
    }
    return taxonomy;
}

std::vector<TGRTTaxonomy::TagPointer> TGRTTaxonomy::tagsFromDictionary(
    const PropertyList::Dictionary& dictionary, const TagPointer& parentTag,
    const CategoryPointer& category) {
    std::vector<TagPointer> tags;
    std::vector<TagToCreate> pending;
    pushSiblings(dictionary, parentTag, pending);
    while (!pending.empty()) {
        const TagToCreate next = std::move(pending.back());
        pending.pop_back();
        const TagPointer tag = TGRTTag::initWithLabel(next.label, next.parent, category);
        tags.push_back(tag);
        if (const auto* children = next.value->dictionary()) pushSiblings(*children, tag, pending);
        if (const auto* leaves = next.value->array()) {
            const auto below = tagsFromArray(*leaves, tag, category);
            tags.insert(tags.end(), below.begin(), below.end());
        }
    }
    return tags;
}

std::vector<TGRTTaxonomy::TagPointer> TGRTTaxonomy::tagsFromArray(const PropertyList::Array& array,
                                                                  const TagPointer& parentTag,
                                                                  const CategoryPointer& category) {
    std::vector<std::string> labels;
    for (const PropertyList& item : array) {
        if (const std::string* label = item.string()) labels.push_back(*label);
    }
    std::vector<TagPointer> tags;
    for (const std::string& label : sortedTagLabelsFromArray(std::move(labels))) {
        tags.push_back(TGRTTag::initWithLabel(label, parentTag, category));
    }
    return tags;
}

std::vector<std::string> TGRTTaxonomy::sortedTagLabelsFromArray(std::vector<std::string> labels) {
    std::stable_sort(labels.begin(), labels.end(),
                     [](const std::string& a, const std::string& b) { return localizedCompare(a, b) < 0; });
    return labels;
}

void TGRTTaxonomy::addCategory(const CategoryPointer& category) {
    if (category && !readOnly_) categories_.insert(category);
}

TGRTTaxonomy::CategoryPointer TGRTTaxonomy::findOrCreateCategoryWithIdentifier(std::string_view identifier,
                                                                               bool overwriteReadonly) {
    if (auto found = findCategoryWithIdentifier(identifier)) return found;
    if (readOnly_ && !overwriteReadonly) return nullptr;
    auto category = TGRTCategory::initWithIdentifier(std::string(identifier));
    categories_.insert(category);
    return category;
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findOrCreateTagWithLabel(std::string_view label,
                                                                std::string_view categoryIdentifier) {
    return findOrCreateTagWithLabel(label, std::nullopt, categoryIdentifier, false);
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findOrCreateTagWithLabel(std::string_view label,
                                                                OptionalLabel parentLabel,
                                                                std::string_view categoryIdentifier,
                                                                bool overwriteReadonly) {
    const auto category = findOrCreateCategoryWithIdentifier(categoryIdentifier, overwriteReadonly);
    if (!category) return nullptr;
    auto found = findInCategory(*category, LabelKey(label), std::nullopt);
    if (found || (readOnly_ && !overwriteReadonly)) return found;
    const auto parent =
        parentLabel ? findInCategory(*category, LabelKey(*parentLabel), std::nullopt) : nullptr;
    return TGRTTag::initWithLabel(label, parent, category);
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findOrCreateSoundPackTagWithIdentifier(std::string_view identifier) {
    if (identifier.empty()) return nullptr;
    return findOrCreateTagWithLabel(identifier, std::nullopt, QVCategorySoundpackIdentifier, true);
}

TGRTTaxonomy::CategoryPointer TGRTTaxonomy::findCategoryWithIdentifier(std::string_view identifier) const {
    const auto hasIdentifier = [identifier](const TGRTCategory& category) {
        return category.identifier() == identifier;
    };
    if (!TGRTCategory::anyWasRenamed_) {
        TGRTCategory* category = categories_.findWithHash(stringHash(identifier), hasIdentifier);
        return category == nullptr ? nullptr : category->shared_from_this();
    }
    const auto hit =
        std::find_if(categories_.begin(), categories_.end(),
                     [&hasIdentifier](const auto& category) { return hasIdentifier(*category); });
    return hit == categories_.end() ? nullptr : *hit;
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findInCategory(const TGRTCategory& category, const LabelKey& label,
                                                      OptionalLabel parentLabel) {
    const auto [only, exact] = category.index_->find(label);
    if (!exact) return findTagWithLabel(label.text, parentLabel, category.tags());
    return only != nullptr && hasParentLabel(*only, parentLabel) ? only->shared_from_this() : nullptr;
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findTagForLabel(std::string_view label) const {
    const LabelKey key(label);
    for (const auto& category : categories_) {
        if (auto tag = findInCategory(*category, key, std::nullopt)) return tag;
    }
    return nullptr;
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findTagForLabel(std::string_view label,
                                                       std::string_view categoryIdentifier) const {
    return findTagForLabel(label, std::nullopt, categoryIdentifier);
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findTagForLabel(std::string_view label, OptionalLabel parentLabel,
                                                       std::string_view categoryIdentifier) const {
    const auto category = findCategoryWithIdentifier(categoryIdentifier);
    return category ? findInCategory(*category, LabelKey(label), parentLabel) : nullptr;
}

TGRTTaxonomy::TagPointer TGRTTaxonomy::findTagWithLabel(std::string_view label, OptionalLabel parentLabel,
                                                        const ObjectSet<TGRTTag>& tags) {
    for (const auto& tag : tags) {
        if (tag->label() == label) {
            if (hasParentLabel(*tag, parentLabel)) return tag;
            continue;
        }
        if (auto below = findTagWithLabel(label, parentLabel, tag->children())) return below;
    }
    return nullptr;
}

bool TGRTTaxonomy::doesContainTag(const TagPointer& tag) const {
    if (!tag || tag->categoryIdentifier().empty()) return false;
    const auto category = findCategoryWithIdentifier(tag->categoryIdentifier());
    return category && category->doesContain(*tag);
}

std::vector<TGRTTaxonomy::TagPointer> TGRTTaxonomy::allTags() const {
    std::vector<TagPointer> tags;
    for (const auto& category : categories_) {
        tags.insert(tags.end(), category->tags().begin(), category->tags().end());
    }
    return tags;
}

ObjectSet<TGRTTag> TGRTTaxonomy::tagsForTaggings(const ObjectSet<TGRTTagging>& taggings,
                                                 OptionalLabel categoryIdentifier,
                                                 bool includingAncestors) const {
    return tagsForTaggings(taggings.ordered(), categoryIdentifier, includingAncestors);
}

ObjectSet<TGRTTag> TGRTTaxonomy::tagsForTaggings(const std::vector<std::shared_ptr<TGRTTagging>>& taggings,
                                                 OptionalLabel categoryIdentifier,
                                                 bool includingAncestors) const {
    ObjectSet<TGRTTag> tags;
    for (const auto& tagging : taggings) {
        if (!tagging || (categoryIdentifier && tagging->category() != *categoryIdentifier)) continue;
        appendTagsOfTagging(*tagging, tags, includingAncestors);
    }
    return tags;
}

ObjectSet<TGRTTag> TGRTTaxonomy::tagsForTaggings(std::initializer_list<std::shared_ptr<TGRTTagging>> taggings,
                                                 OptionalLabel categoryIdentifier,
                                                 bool includingAncestors) const {
    return tagsForTaggings(std::vector(taggings), categoryIdentifier, includingAncestors);
}

void TGRTTaxonomy::appendTagsOfTagging(const TGRTTagging& tagging, ObjectSet<TGRTTag>& set,
                                       bool includingAncestors) const {
    const auto tag = findTagForLabel(tagging.label(), tagging.category());
    if (!tag) return;
    set.insert(tag);
    if (!includingAncestors) return;
    for (const auto& ancestor : tag->ancestors()) set.insert(ancestor);
}

std::uint64_t TGRTTaxonomy::revision() const {
    std::uint64_t changes = categories_.size();
    for (const auto& category : categories_) changes += category->index_->revision();
    return changes;
}

PropertyList::Dictionary TGRTTaxonomy::dictionary() const {
    PropertyList::Dictionary categories;
    for (const auto& category : categories_) categories.set(category->identifier(), category->dictionary());
    PropertyList::Dictionary root;
    root.set(kCategoriesKey, std::move(categories));  // moved: the list may be deep
    return root;
}

bool TGRTTaxonomy::writeToURL(const URL& url, Error* error) const {
    return writePropertyListFile(dictionary(), url.path(), PropertyListFormat::xml, error);
}

std::string TGRTTaxonomy::serializedTaxonomyData() const {
    return serializePropertyList(dictionary(), PropertyListFormat::binary);
}

std::vector<std::string> TGRTTaxonomy::mappingExport() const {
    std::vector<std::string> rows = {std::string(kLegacyMappingHeader)};
    for (const auto& tag : allTags()) rows.push_back(mappingExportForTag(*tag));
    return rows;
}

std::string TGRTTaxonomy::mappingExportForTag(const TGRTTag& tag) const {
    const auto parent = tag.parent();
    const bool isSub = parent && !parent->label().empty();
    return fmt::format("{};{};{};;;;;", tag.categoryIdentifier(), isSub ? parent->label() : tag.label(),
                       isSub ? tag.label() : "");
}

std::string TGRTTaxonomy::description() const {
    std::string lines = "\n";
    for (const auto& category : categories_) lines += category->description() + "\n";
    return fmt::format("<TGRTTaxonomy {}> categories: {}", static_cast<const void*>(this), lines);
}

TGRTTaxonomy::Localization TGRTTaxonomy::localizationDictionary() const {
    return localizationOf(*this);
}

std::string TGRTTaxonomy::localizedStrings() const {
    return stringsTableOf(localizationDictionary());
}

}  // namespace qvct
