#pragma once

#include "metadata/TGRTMetaData.h"
#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/text/Url.h"

#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace qvct {

/// A content pack: what it is called, and the items that are tagged with it.
///
/// Packs with one identifier are equal.
class QVCT_API TGRTPackage : public Object {
  public:
    /// Identifier and display name of the packs that are known.
    using Names = std::vector<std::pair<std::string, std::string>>;

    /// An empty pack. Its display name is the one in the resources, or else the identifier.
    static std::shared_ptr<TGRTPackage> packageWithIdentifier(std::string identifier);

    /// The identifiers of the packs that a record's taggings name, in their order.
    static std::vector<std::string> identifiersForMetaData(const TGRTMetaData& metaData);
    /// The packs that the items' stored tags name, in the order in which they turn up, each with its items.
    /// Items that cannot be read belong to none.
    static std::vector<std::shared_ptr<TGRTPackage>> packagesForItems(const std::vector<URL>& items);

    const std::string& identifier() const { return identifier_; }
    const std::string& displayName() const { return displayName_; }
    void setDisplayName(std::string name) { displayName_ = std::move(name); }
    /// In the order in which they were added.
    const std::vector<URL>& items() const { return items_; }
    /// Adds the item after the others.
    void addItem(URL item) { items_.push_back(std::move(item)); }

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return stringHash(identifier_); }
    std::string description() const override;

  private:
    static std::shared_ptr<TGRTPackage> packageWithIdentifier(std::string identifier, const Names& names);
    TGRTPackage(std::string identifier, std::string displayName)
        : identifier_(std::move(identifier)), displayName_(std::move(displayName)) {}

    std::string identifier_;
    std::string displayName_;
    std::vector<URL> items_;
};

}  // namespace qvct
