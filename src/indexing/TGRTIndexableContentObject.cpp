#include "indexing/TGRTIndexableContentObject.h"

#include "formats/QVContentEditorFileUtilities.h"
#include "formats/TGRTMetaDataReaderFactory.h"
#include "taxonomy/TaggingSetAdditions.h"
#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include <array>

#include <fmt/format.h>

namespace qvct {
namespace {

using Taggings = TGRTIndexableContentObject::Taggings;
using CategoryTaggings = TGRTIndexableContentObject::CategoryTaggings;
using OptionalLabel = TGRTIndexableContentObject::OptionalLabel;

CategoryTaggings taggingsByCategory(const Taggings& taggings) {
    CategoryTaggings byCategory;
    for (const auto& tagging : taggings) {
        if (!tagging->category().empty()) byCategory[tagging->category()].insert(tagging);
    }
    return byCategory;
}

const Taggings& taggingsOfCategory(const CategoryTaggings& byCategory, std::string_view identifier) {
    static const Taggings none;
    const auto hit = byCategory.find(identifier);
    return hit == byCategory.end() ? none : hit->second;
}

/// The mapped tagging with the taxonomy's own tag; null when it must not be added to what the item has.
std::shared_ptr<TGRTTagging> additionForMappedTagging(const TGRTTagging& mapped,
                                                      const CategoryTaggings& byCategory,
                                                      const TGRTTaxonomy& taxonomy) {
    const std::string& category = mapped.category();
    const bool isSilentEffect =
        category == QVCategoryEffectsIdentifier && mapped.level() != nullptr && mapped.level()->weight() == 0;
    if (isSilentEffect) return nullptr;
    if (containsTagWithLabel(taggingsOfCategory(byCategory, category), mapped.label())) return nullptr;
    return TGRTTagging::initWithTag(taxonomy.findTagForLabel(mapped.label(), category), mapped.level());
}

/// The tag of the retired vocabulary that a tagging names. It is looked up anew: the taxonomy of the
/// tagging's own tag may be gone, and with it the parent that the mapping needs.
std::shared_ptr<TGRTTag> legacyTagForTagging(const TGRTTagging& tagging, const TGRTTaxonomy& legacyTaxonomy) {
    const OptionalLabel parent =
        tagging.parentLabel().empty() ? std::nullopt : OptionalLabel(tagging.parentLabel());
    return legacyTaxonomy.findTagForLabel(tagging.label(), parent, tagging.category());
}

std::shared_ptr<TGRTMetaData> readRecord(const URL& url, std::uint64_t options,
                                         const std::shared_ptr<TGRTTaxonomy>& taxonomy, Error* error) {
    if (const auto reader = TGRTMetaDataReaderFactory::metaDataReaderForURL(url, taxonomy)) {
        return reader->readMetaDataFromURL(url, options, error);
    }
    fail(error, kErrorNoContent, "no kind of content", {url.path()});
    return nullptr;
}

}  // namespace

std::shared_ptr<TGRTIndexableContentObject> TGRTIndexableContentObject::init() {
    return std::shared_ptr<TGRTIndexableContentObject>(new TGRTIndexableContentObject);
}

std::shared_ptr<TGRTIndexableContentObject> TGRTIndexableContentObject::indexableContentObjectForURL(
    const URL& url, std::uint64_t options, Error* error) {
    if (!url.isFileURL()) {
        fail(error, kErrorInvalidArgument, "not a file URL", {url.absoluteString()});
        return nullptr;
    }
    const auto taxonomy = taxonomyForOptions(options);
    const auto record = readRecord(url, options, taxonomy, error);
    const bool isKnown = record && record->fileType() != kFileTypeNone;
    if (!isKnown && (options & kIndexWithoutRecord) == 0) return nullptr;

    return indexableContentObjectForMetaData(record.get(), url, *taxonomy);
}

std::shared_ptr<TGRTIndexableContentObject> TGRTIndexableContentObject::indexableContentObjectForMetaData(
    const TGRTMetaData* metaData, const URL& url, const TGRTTaxonomy& taxonomy) {
    auto object = init();
    const std::string name = metaData != nullptr ? metaData->displayName().value_or("") : "";
    object->setDisplayName(name.empty() ? url.lastPathComponentWithoutExtension() : name);
    object->setPreviewAvailable(QVContentEditorFileUtilities::prelistenURLForURL(url).has_value());
    object->setTaggingDatas(taggingsByAddingVirtualTagsToTaggings(
        metaData != nullptr ? metaData->taggings() : Taggings(), metaData, taxonomy));
    if (metaData == nullptr) return object;
    object->setFileType(metaData->fileType());
    object->setSubFileType(metaData->subFileType());
    object->setValueDatas(metaData->keyValues());
    object->setPackageIdentifiers(packageIdentifierFromTaggings(metaData->taggings()));
    if (metaData->contentInfo()) object->setDependencyItems(metaData->contentInfo()->assetDependencyItems());
    return object;
}

std::shared_ptr<TGRTTaxonomy> TGRTIndexableContentObject::taxonomyForOptions(std::uint64_t options) {
    return (options & kIndexInMutableTaxonomy) != 0 ? TGRTTaxonomy::mutableDefaultTaxonomy()
                                                    : TGRTTaxonomy::defaultTaxonomy();
}

std::set<std::string> TGRTIndexableContentObject::packageIdentifierFromTaggings(const Taggings& taggings) {
    std::set<std::string> identifiers;
    for (const auto& tagging : taggings) {
        if (tagging->category() == QVCategorySoundpackIdentifier) identifiers.insert(tagging->label());
    }
    return identifiers;
}

Taggings TGRTIndexableContentObject::taggingsByAddingVirtualTagsToTaggings(const Taggings& taggings,
                                                                           const TGRTMetaData* metaData,
                                                                           const TGRTTaxonomy& taxonomy) {
    const CategoryTaggings byCategory = taggingsByCategory(taggings);
    // The ancestors are computed here but not handed over: hosts put them into tables of their own.
    Taggings withAncestors = taggings;
    withAncestors.insertAll(virtualTaggings(taggings, byCategory));

    Taggings result = adjustTaggings(taggings, byCategory, taxonomy);
    if (metaData == nullptr) return result;
    result.insert(taggingForTagLabel(tagLabelForFileType(metaData->fileType()), std::nullopt,
                                     QVCategoryContentTypeIdentifier, taxonomy));
    result.insertAll(virtualLoopTaggingsForMetaData(*metaData, taxonomy));
    return result;
}

Taggings TGRTIndexableContentObject::virtualTaggings(const Taggings& taggings,
                                                     const CategoryTaggings& categoryTaggingsMapping) {
    Taggings ancestors;
    const auto addAncestors = [&](std::string_view category, const std::shared_ptr<TGRTLevel>& level) {
        for (const auto& tagging : taggingsOfCategory(categoryTaggingsMapping, category)) {
            for (auto tag = tagging->tag()->parent(); tag; tag = tag->parent()) {
                if (!containsTagWithLabel(taggings, tag->label())) {
                    ancestors.insert(TGRTTagging::initWithTag(tag, level));
                }
            }
        }
    };
    addAncestors(QVCategoryGenresIdentifier, TGRTLevel::levelWithWeight(kTaggingLevel2));
    addAncestors(QVCategorySourceIdentifier, nullptr);
    addAncestors(QVCategoryContentTypeIdentifier, nullptr);
    return ancestors;
}

Taggings TGRTIndexableContentObject::adjustTaggings(const Taggings& taggings,
                                                    const CategoryTaggings& categoryTaggingsMapping,
                                                    const TGRTTaxonomy& taxonomy) {
    Taggings adjusted = taggings;
    const auto mapping = TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping();
    if (!mapping) return adjusted;
    const auto legacyTaxonomy = TGRTTaxonomy::legacyLoopTaxonomy();
    for (const auto& category : legacyTaxonomy->categories()) {
        for (const auto& tagging : taggingsOfCategory(categoryTaggingsMapping, category->identifier())) {
            const auto legacyTag = legacyTagForTagging(*tagging, *legacyTaxonomy);
            if (!legacyTag) continue;
            for (const auto& mapped : mapping->taggingsForLegacyTag(*legacyTag)) {
                adjusted.insert(additionForMappedTagging(*mapped, categoryTaggingsMapping, taxonomy));
            }
        }
    }
    return adjusted;
}

std::shared_ptr<TGRTTagging> TGRTIndexableContentObject::taggingForTagLabel(
    OptionalLabel label, OptionalLabel parentLabel, std::string_view categoryIdentifier,
    const TGRTTaxonomy& taxonomy) {
    if (!label) return nullptr;
    return TGRTTagging::initWithTag(taxonomy.findTagForLabel(*label, parentLabel, categoryIdentifier),
                                    nullptr);
}

OptionalLabel TGRTIndexableContentObject::tagLabelForFileType(std::int64_t fileType) {
    switch (fileType) {
        case kFileTypePatch:
            return QVTagPatch;
        case kFileTypeLoop:
            return QVTagTavioLoop;
        case kFileTypeSynthPreset:
            return QVTagVorthalSetting;
        case kFileTypeSamplerSettings:
            return QVTagSXV;
        case kFileTypePlugInSettings:
            return QVTagPST;
        case kFileTypeChannelStrip:
            return QVTagCST;
        case kFileTypeProject:
            return QVTagProject;
        default:
            return std::nullopt;
    }
}

Taggings TGRTIndexableContentObject::virtualLoopTaggingsForMetaData(const TGRTMetaData& metaData,
                                                                    const TGRTTaxonomy& taxonomy) {
    Taggings taggings;
    if (metaData.fileType() != kFileTypeLoop) return taggings;
    const auto integer = [&metaData](std::string_view key) {
        const auto value = metaData.valueForKey(key);
        return value ? value->integerValue().value_or(0) : 0;
    };
    const auto add = [&](OptionalLabel label, std::string_view parent) {
        taggings.insert(taggingForTagLabel(label, parent, QVCategoryLoopSpecificsIdentifier, taxonomy));
    };
    const std::int64_t top = integer(QVContentKeySignatureTop);
    const std::int64_t bottom = integer(QVContentKeySignatureBottom);
    if (top >= 1 && bottom >= 1) add(fmt::format("{}/{}", top, bottom), QVTagTimeSignature);
    add(keyTypeTagForKeyType(integer(QVContentKeyKeyType)), QVTagKeyType);
    add(keyTagForMidiRootNote(integer(QVContentKeyMidiRootNote)), QVTagKey);
    return taggings;
}

std::string_view TGRTIndexableContentObject::keyTypeTagForKeyType(std::int64_t keyType) {
    switch (keyType) {
        case 1:
            return QVTagMinorKeyType;
        case 2:
            return QVTagMajorKeyType;
        case 3:
            return QVTagNeitherKeyType;
        case 4:
            return QVTagBothKeyType;
        default:
            return QVTagAnyKeyType;
    }
}

OptionalLabel TGRTIndexableContentObject::keyTagForMidiRootNote(std::int64_t note) {
    constexpr std::int64_t firstNote = 48;
    if (note < firstNote || note >= firstNote + static_cast<std::int64_t>(QVTagsOfKeys.size()))
        return std::nullopt;
    return QVTagsOfKeys[static_cast<std::size_t>(note - firstNote)];
}

std::string TGRTIndexableContentObject::description() const {
    return fmt::format(
        "<TGRTIndexableContentObject {}> displayName: {} fileType: {} subFileType: {} "
        "taggings: {}",
        static_cast<const void*>(this), displayName_, fileType_, subFileType_, taggingDatas_.description());
}

}  // namespace qvct
