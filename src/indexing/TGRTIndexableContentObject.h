#pragma once

#include "indexing/QVContentTaggingIndexableContentObject.h"
#include "metadata/TGRTMetaData.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"
#include "taxonomy/labels/OptionalLabel.h"

#include <map>
#include <memory>
#include <optional>
#include <string_view>
#include <utility>

namespace qvct {

/// How an indexable object is made; a bit set that readers are given, too (MetaDataReaderOptions).
enum IndexingOptions : std::uint64_t {
    kIndexInMutableTaxonomy = 0x4,  ///< Labels that the default taxonomy lacks join the shared writable one.
    kIndexWithoutRecord = 0x100     ///< Also items that store nothing, or not what they are.
};

/// One content item as a host's database stores it: flat, and complete with the taggings that follow from its
/// record.
///
/// It is built from one item alone and not changed afterwards. The class operations have no state: they are
/// as safe from several threads as readers and taxonomy are, so with kIndexInMutableTaxonomy one at a time.
class QVCT_API TGRTIndexableContentObject : public Object, public QVContentTaggingIndexableContentObject {
  public:
    using Taggings = ObjectSet<TGRTTagging>;
    using CategoryTaggings = std::map<std::string, Taggings, std::less<>>;
    using OptionalLabel = qvct::OptionalLabel;

    /// An empty one.
    static std::shared_ptr<TGRTIndexableContentObject> init();

    /// The object of the item at a file URL. Null for another URL, and, unless kIndexWithoutRecord is set,
    /// for an item without record or file type; the error is set whenever something is wrong with the URL or
    /// the item, even if an object is returned.
    static std::shared_ptr<TGRTIndexableContentObject> indexableContentObjectForURL(const URL& url,
                                                                                    std::uint64_t options,
                                                                                    Error* error = nullptr);

    /// The object of an item whose record has been read; it may be null. Never null.
    static std::shared_ptr<TGRTIndexableContentObject> indexableContentObjectForMetaData(
        const TGRTMetaData* metaData, const URL& url, const TGRTTaxonomy& taxonomy);

    // What it is made of.

    /// The default taxonomy: with kIndexInMutableTaxonomy the shared writable one.
    static std::shared_ptr<TGRTTaxonomy> taxonomyForOptions(std::uint64_t options);
    /// The labels of the taggings that name a content pack.
    static std::set<std::string> packageIdentifierFromTaggings(const Taggings& taggings);
    /// `adjustTaggings`, the content type that the file type stands for, and what the values of a loop say.
    /// Ancestors of the tags are left to the host, which knows the tree. The record may be null.
    static Taggings taggingsByAddingVirtualTagsToTaggings(const Taggings& taggings,
                                                          const TGRTMetaData* metaData,
                                                          const TGRTTaxonomy& taxonomy);
    /// Taggings of the ancestors of every genre (at kTaggingLevel2), source and content type, but of none
    /// whose label the taggings have already.
    static Taggings virtualTaggings(const Taggings& taggings,
                                    const CategoryTaggings& categoryTaggingsMapping);
    /// All given taggings, and for every keyword of the retired loop vocabulary among them its present-day
    /// tag, with the level that the mapping table gives it.
    ///
    /// Not added are tags that the taxonomy lacks, tags that the item already has in that category (its own
    /// level stays), and effects at level 0: with these a table says that the effect is not heard, so the
    /// item must not be found under it.
    static Taggings adjustTaggings(const Taggings& taggings, const CategoryTaggings& categoryTaggingsMapping,
                                   const TGRTTaxonomy& taxonomy);
    /// Without level. Null for no label, and when the taxonomy has no such tag.
    static std::shared_ptr<TGRTTagging> taggingForTagLabel(OptionalLabel label, OptionalLabel parentLabel,
                                                           std::string_view categoryIdentifier,
                                                           const TGRTTaxonomy& taxonomy);
    /// Nothing for an audio file and for unknown types.
    static OptionalLabel tagLabelForFileType(std::int64_t fileType);
    /// Time signature, kind of key and key of a loop, as far as the taxonomy has tags for them; none for
    /// other content.
    static Taggings virtualLoopTaggingsForMetaData(const TGRTMetaData& metaData,
                                                   const TGRTTaxonomy& taxonomy);
    /// 1 minor, 2 major, 3 neither, 4 both; any key type for other numbers.
    static std::string_view keyTypeTagForKeyType(std::int64_t keyType);
    /// Only for the octave from 48 to 59, in which loops keep their root.
    static OptionalLabel keyTagForMidiRootNote(std::int64_t note);

    bool previewAvailable() const override { return previewAvailable_; }
    void setPreviewAvailable(bool isAvailable) { previewAvailable_ = isAvailable; }
    std::int64_t fileType() const override { return fileType_; }
    void setFileType(std::int64_t fileType) { fileType_ = fileType; }
    std::int64_t subFileType() const override { return subFileType_; }
    void setSubFileType(std::int64_t subFileType) { subFileType_ = subFileType; }
    const std::string& displayName() const override { return displayName_; }
    void setDisplayName(std::string name) { displayName_ = std::move(name); }
    const Taggings& taggingDatas() const override { return taggingDatas_; }
    void setTaggingDatas(Taggings taggings) { taggingDatas_ = std::move(taggings); }
    const ObjectSet<TGRTKeyValue>& valueDatas() const override { return valueDatas_; }
    void setValueDatas(ObjectSet<TGRTKeyValue> values) { valueDatas_ = std::move(values); }
    const std::set<std::string>& packageIdentifiers() const override { return packageIdentifiers_; }
    void setPackageIdentifiers(std::set<std::string> packs) { packageIdentifiers_ = std::move(packs); }
    const ObjectSet<TGRTDependencyItem>& dependencyItems() const override { return dependencyItems_; }
    void setDependencyItems(ObjectSet<TGRTDependencyItem> items) { dependencyItems_ = std::move(items); }

    std::string description() const override;

  private:
    TGRTIndexableContentObject() = default;

    bool previewAvailable_ = false;
    std::int64_t fileType_ = kFileTypeNone;
    std::int64_t subFileType_ = 0;
    std::string displayName_;
    Taggings taggingDatas_;
    ObjectSet<TGRTKeyValue> valueDatas_;
    std::set<std::string> packageIdentifiers_;
    ObjectSet<TGRTDependencyItem> dependencyItems_;
};

}  // namespace qvct
