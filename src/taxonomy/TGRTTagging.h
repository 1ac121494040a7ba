#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "taxonomy/TGRTLevel.h"
#include "taxonomy/TGRTTag.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qvct {

class DecimalFormatter;
class TGRTTaxonomy;

/// What a host's database stores of a tagging.
class QVCT_API QVContentTaggingIndexableTaggingData {
  public:
    virtual ~QVContentTaggingIndexableTaggingData() = default;
    virtual const std::string& label() const = 0;
    /// Empty for a root tag.
    virtual const std::string& parentLabel() const = 0;
    virtual const std::string& category() const = 0;
    /// 0 to 10.
    virtual std::int64_t weightLevel() const = 0;
    virtual std::int64_t type() const = 0;
};

/// One tag applied to one piece of content, with a level or without.
///
/// Label, parent label and category are those of the tag at creation. Equality is that of label, level and
/// category; whether a tagging service made it does not matter.
class QVCT_API TGRTTagging : public Object, public QVContentTaggingIndexableTaggingData {
  public:
    /// Null for a null tag or one without label. The level may be null.
    static std::shared_ptr<TGRTTagging> initWithTag(std::shared_ptr<TGRTTag> tag,
                                                    std::shared_ptr<TGRTLevel> level);

    const std::shared_ptr<TGRTTag>& tag() const { return tag_; }
    const std::shared_ptr<TGRTLevel>& level() const { return level_; }
    const std::string& label() const override { return label_; }
    const std::string& parentLabel() const override { return parentLabel_; }
    const std::string& category() const override { return category_; }
    std::int64_t type() const override { return tag_->type(); }
    bool isAutoTagging() const { return isAutoTagging_; }
    void setIsAutoTagging(bool isAutoTagging) { isAutoTagging_ = isAutoTagging; }

    /// The level's weight, else that of the tag's default level, else 1.
    float weight() const;
    /// Tenths of the weight, halves rounded away from zero.
    std::int64_t weightLevel() const override;
    /// The label, with the level in parentheses as the user's locale writes it: 1 to 4 for the four named
    /// levels, else the weight times 4 with one decimal.
    std::string displayString() const;

    /// Writes weights other than the four named levels: with one decimal. Shared by all threads.
    static const DecimalFormatter& doubleFormatter();

    /// @{
    /// The taggings that a tagging dictionary holds; none for null or another value. Unknown labels are added
    /// to the taxonomy, or dropped when it is read-only; malformed entries are passed over.
    static ObjectSet<TGRTTagging> taggingsWithTaggingDictionary(const PropertyList* dictionary,
                                                                TGRTTaxonomy& taxonomy);
    static ObjectSet<TGRTTagging> taggingsWithTaggingDictionary(const PropertyList::Dictionary& dictionary,
                                                                TGRTTaxonomy& taxonomy);
    /// @}
    /// @{
    /// The same in the shared writable default taxonomy, which thereby may grow.
    static ObjectSet<TGRTTagging> taggingsWithTaggingDictionary(const PropertyList* dictionary);
    static ObjectSet<TGRTTagging> taggingsWithTaggingDictionary(const PropertyList::Dictionary& dictionary);
    /// @}
    /// Category identifier → entries by label, as files store them.
    static PropertyList::Dictionary taggingDictionaryForTaggings(const ObjectSet<TGRTTagging>& taggings);
    /// The same of an array: equal taggings each get an entry, in their order. Null ones are ignored.
    static PropertyList::Dictionary taggingDictionaryForTaggings(
        std::vector<std::shared_ptr<TGRTTagging>> taggings);

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return hash_; }
    std::string description() const override;

  private:
    TGRTTagging(std::shared_ptr<TGRTTag> tag, std::shared_ptr<TGRTLevel> level);

    std::shared_ptr<TGRTTag> tag_;
    std::shared_ptr<TGRTLevel> level_;
    std::string label_;
    std::string parentLabel_;
    std::string category_;
    bool isAutoTagging_ = false;
    std::size_t hash_;
};

}  // namespace qvct
