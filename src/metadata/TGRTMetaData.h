#pragma once

#include "metadata/TGRTContentInfo.h"
#include "metadata/TGRTKeyValue.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>

namespace qvct {

class TGRTTaxonomy;

/// The record of one content item: everything that its file stores about it.
///
/// It owns its content info; key values and taggings are shared with whoever made them. Use one record from
/// one thread at a time.
class QVCT_API TGRTMetaData : public Object {
  public:
    /// An empty record.
    static std::shared_ptr<TGRTMetaData> init();

    /// Nothing when the item has no name but that of its file.
    const std::optional<std::string>& displayName() const { return displayName_; }
    void setDisplayName(std::optional<std::string> name) { displayName_ = std::move(name); }
    /// A FileType, though files may hold other numbers; 0 for none.
    std::int64_t fileType() const { return fileType_; }
    void setFileType(std::int64_t fileType) { fileType_ = fileType; }
    /// 0 for none.
    std::int64_t subFileType() const { return subFileType_; }
    void setSubFileType(std::int64_t subFileType) { subFileType_ = subFileType; }
    const ObjectSet<TGRTTagging>& taggings() const { return taggings_; }
    void setTaggings(ObjectSet<TGRTTagging> taggings) { taggings_ = std::move(taggings); }
    const ObjectSet<TGRTKeyValue>& keyValues() const { return keyValues_; }
    void setKeyValues(ObjectSet<TGRTKeyValue> keyValues) { keyValues_ = std::move(keyValues); }
    /// Null until one is set.
    const std::shared_ptr<TGRTContentInfo>& contentInfo() const { return contentInfo_; }
    /// Keeps a copy.
    void setContentInfo(const std::shared_ptr<TGRTContentInfo>& contentInfo);
    /// Labels of tags that a person rejected: neither these nor the tags below them are derived again.
    const std::set<std::string>& rejectedLabels() const;
    void setRejectedLabels(std::set<std::string> labels) { rejectedLabels_ = std::move(labels); }
    /// Whether they were read or set. A record that does not know them leaves those that are stored.
    bool knowsRejectedLabels() const { return rejectedLabels_.has_value(); }

    /// The value of the key-value item with that key.
    std::optional<PropertyList> valueForKey(std::string_view key) const;

    /// Puts the record into the dictionary that an item stores.
    ///
    /// Entries that a record does not know stay where they are, at every depth. So do a stored sub-type and
    /// content info if the record has none. A stored UUID is removed.
    void storeInto(PropertyList::Dictionary& stored) const;
    /// The same for an item whose dictionary holds nothing but the record. Other entries are removed, unless
    /// their key was in the dictionary that the record was read from. A stored sub-type and content info are
    /// removed if the record has none.
    void storeOver(PropertyList::Dictionary& stored) const;
    /// What to store at the URL: this record put into the property list that is stored there, by `storeInto`.
    ///
    /// When nothing is stored there it starts empty. It also starts empty when what is there cannot be read,
    /// or is followed by other bytes. Then the error says so, since writing the result would destroy what is
    /// there.
    PropertyList::Dictionary prepareDictionaryForURL(const URL& url, Error* error = nullptr) const;

    /// The record that a dictionary holds; null without dictionary. Entries of the wrong type count as
    /// absent. Labels that the taxonomy does not know are added to it, or dropped when it is read-only.
    static std::shared_ptr<TGRTMetaData> metaDataFromDictionary(const PropertyList::Dictionary* dictionary,
                                                                TGRTTaxonomy& taxonomy);
    /// The taggings alone; none without that entry. Labels as above.
    static ObjectSet<TGRTTagging> taggingsFromDictionary(const PropertyList::Dictionary& dictionary,
                                                         TGRTTaxonomy& taxonomy);
    /// Never null.
    static std::shared_ptr<TGRTContentInfo> contentInfoFromDictionary(
        const PropertyList::Dictionary& dictionary);
    /// The key values alone; none without that entry.
    static ObjectSet<TGRTKeyValue> keyValuesFromDictionary(const PropertyList::Dictionary& dictionary);
    /// The rejected labels alone; none without that entry.
    static std::set<std::string> rejectedLabelsFromDictionary(const PropertyList::Dictionary& dictionary);

    std::string description() const override;

  private:
    TGRTMetaData() = default;

    std::optional<std::string> displayName_;
    std::int64_t fileType_ = 0;
    std::int64_t subFileType_ = 0;
    ObjectSet<TGRTTagging> taggings_;
    ObjectSet<TGRTKeyValue> keyValues_;
    std::shared_ptr<TGRTContentInfo> contentInfo_;
    std::optional<std::set<std::string>> rejectedLabels_;
    std::set<std::string, std::less<>> foreignKeys_;  // of the dictionary that it was read from
};

}  // namespace qvct
