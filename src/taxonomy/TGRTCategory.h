#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"

#include <atomic>
#include <memory>
#include <string>
#include <vector>

namespace qvct {

class LabelIndex;
class TGRTTag;

/// What a host sees of a category.
class QVCT_API QVContentTaggingCategory {
  public:
    virtual ~QVContentTaggingCategory() = default;
    virtual const std::string& identifier() const = 0;
    /// All tags, at every depth.
    virtual const ObjectSet<TGRTTag>& tags() const = 0;
    virtual ObjectSet<TGRTTag> rootTags() const = 0;
};

/// A named bucket of tags, such as "Genres".
///
/// Tags join it as they are created. It keeps an index of their labels, so that a search does not walk the
/// tree.
class QVCT_API TGRTCategory : public Object,
                              public QVContentTaggingCategory,
                              public std::enable_shared_from_this<TGRTCategory> {
  public:
    /// An empty category.
    static std::shared_ptr<TGRTCategory> initWithIdentifier(std::string identifier);
    ~TGRTCategory() override;

    const std::string& identifier() const override { return identifier_; }
    /// Does not change hash and equality, which are those of the identifier at creation.
    void setIdentifier(std::string identifier);

    /// Adds the tag without its children. Null is ignored.
    void addTag(const std::shared_ptr<TGRTTag>& tag);
    /// Removes the tag without its children. Null is ignored.
    void removeTag(const std::shared_ptr<TGRTTag>& tag);
    /// Whether an equal tag is here, at any depth.
    bool doesContain(const TGRTTag& tag) const;
    const ObjectSet<TGRTTag>& tags() const override { return tags_; }
    /// All tags in the order in which they joined.
    const std::vector<std::shared_ptr<TGRTTag>>& orderedTags() const { return tags_.ordered(); }
    ObjectSet<TGRTTag> rootTags() const override;

    /// 1 when `a` joined after `b`, else -1, even for the same tag. A tag that is not here sorts last.
    int compareTag(const TGRTTag& a, const TGRTTag& b) const;
    PropertyList::Dictionary dictionary() const;

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return hash_; }
    std::string description() const override;

  private:
    friend class TGRTTag;
    friend class TGRTTaxonomy;

    explicit TGRTCategory(std::string identifier);

    /// Tells the index that the tree was changed by other means than creating tags.
    void treeChanged();

    /// Whether any category of this process has been given another identifier. While none has, each is found
    /// by the hash of its identifier.
    static inline std::atomic<bool> anyWasRenamed_ = false;

    std::string identifier_;
    std::size_t hash_;
    ObjectSet<TGRTTag> tags_;
    std::unique_ptr<LabelIndex> index_;
};

}  // namespace qvct
