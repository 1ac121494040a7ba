#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "taxonomy/TGRTLevel.h"
#include "taxonomy/labels/TagNormalization.h"

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

class TGRTCategory;
class TGRTTag;

/// What a host sees of a tag.
class QVCT_API QVContentTaggingTag {
  public:
    virtual ~QVContentTaggingTag() = default;
    virtual const std::string& label() const = 0;
    /// The names of the value steps; empty for most tags.
    virtual const std::vector<std::string>& enumeratedLabels() const = 0;
    virtual std::shared_ptr<TGRTTag> parent() const = 0;
    virtual const ObjectSet<TGRTTag>& children() const = 0;
    virtual std::shared_ptr<TGRTCategory> category() const = 0;
    /// 1 bipolar; 2 a flag, a content pack or a content type; else 0.
    virtual std::int64_t type() const = 0;
};

/// One descriptive label of a taxonomy: a node of its category's tree, with the kind of value it takes.
///
/// A tag is owned by its category and its parent; its own links upward are weak, so the taxonomy must be kept
/// while its tags are used. Equality and hash are those of (label, parent's label, category) at creation.
class QVCT_API TGRTTag : public Object,
                         public QVContentTaggingTag,
                         public std::enable_shared_from_this<TGRTTag> {
  public:
    /// A tag of a raw label, whose markers become its value type and steps. It joins the parent's children
    /// and the category. Parent and category may be null.
    static std::shared_ptr<TGRTTag> initWithLabel(std::string_view rawLabel,
                                                  const std::shared_ptr<TGRTTag>& parentTag,
                                                  const std::shared_ptr<TGRTCategory>& category);
    /// A tag without label; the dictionary is not read.
    static std::shared_ptr<TGRTTag> initWithDictionary(const PropertyList::Dictionary& dictionary);

    const std::string& label() const override { return label_; }
    void setLabel(std::string label);
    TagValueType valueType() const { return valueType_; }
    void setValueType(TagValueType valueType) { valueType_ = valueType; }
    std::int64_t numberOfTagValueSteps() const { return numberOfTagValueSteps_; }
    void setNumberOfTagValueSteps(std::int64_t steps) { numberOfTagValueSteps_ = steps; }
    const std::vector<std::string>& valueStepLabels() const { return valueStepLabels_; }
    const std::vector<std::string>& enumeratedLabels() const override { return valueStepLabels_; }

    /// Null for a root tag, and once the parent is gone.
    std::shared_ptr<TGRTTag> parent() const override { return parent_.lock(); }
    std::shared_ptr<TGRTCategory> category() const override { return category_.lock(); }
    /// The category's identifier; empty without category.
    std::string categoryIdentifier() const;
    const ObjectSet<TGRTTag>& children() const override { return children_; }
    /// Moves the child here from its current parent's children. The child's own link upward stays as it is.
    /// Ignored: null, this tag itself, and any tag above it, since trees have no cycles.
    /// @cost  O(descendants of the child).
    void addChild(std::shared_ptr<TGRTTag> tag);
    /// Takes the child out. Null is ignored.
    void removeChild(const std::shared_ptr<TGRTTag>& tag);

    /// The parent first, then its ancestors.
    std::vector<std::shared_ptr<TGRTTag>> ancestors() const;
    /// The children, then the descendants of each in turn.
    std::vector<std::shared_ptr<TGRTTag>> descendants() const;
    /// The topmost of its ancestors; the tag itself when it has none.
    std::shared_ptr<TGRTTag> rootTag();

    /// The label with its marker written back. Bipolar poles come out as named steps in braces.
    std::string serializedLabel() const;
    /// The subtree below this tag as the taxonomy's property list holds it.
    PropertyList::Dictionary dictionary() const;

    /// Null for a plain tag: it has no level of its own.
    std::shared_ptr<TGRTLevel> defaultLevel() const { return defaultLevelForValueType(valueType_); }
    /// The default level of tags of a TagValueType.
    static std::shared_ptr<TGRTLevel> defaultLevelForValueType(std::int64_t valueType);
    std::int64_t type() const override;
    /// The identifier of the content pack that this tag stands for; nothing in other categories.
    std::optional<std::string> packageIdentifier() const;

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return hash_; }
    std::string description() const override;

  private:
    TGRTTag() = default;
    /// Tells the category that the tree below this tag is no longer the one that was created.
    void tellCategory() const;

    std::string label_;
    TagValueType valueType_ = kTagValuePlain;
    std::int64_t numberOfTagValueSteps_ = 0;
    std::vector<std::string> valueStepLabels_;
    ObjectSet<TGRTTag> children_;
    std::weak_ptr<TGRTTag> parent_;
    std::weak_ptr<TGRTCategory> category_;
    std::size_t hash_ = 0;
};

}  // namespace qvct
