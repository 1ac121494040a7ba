#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"

#include <memory>
#include <string>

namespace qvct {

/// What a host's database stores of a dependency.
class QVCT_API QVContentTaggingDependencyItem {
  public:
    virtual ~QVContentTaggingDependencyItem() = default;
    virtual std::string UUID() const = 0;
    /// The absolute path of what the content needs.
    virtual std::string path() const = 0;
};

/// A file that content depends on, such as a sample: its path and the identifier that follows from it.
///
/// Two items are equal when their identifiers are; an item without path equals nothing, not even itself.
class QVCT_API TGRTDependencyItem : public Object, public QVContentTaggingDependencyItem {
  public:
    /// The item for a path; its identifier is that of `QVCTUUIDGenerator`.
    static std::shared_ptr<TGRTDependencyItem> dependencyItemWithPath(std::string path);

    std::string UUID() const override { return identifier_; }
    std::string path() const override { return path_; }
    // Setting does not change the hash, which is that of the identifier at creation.
    void setUUID(std::string identifier) { identifier_ = std::move(identifier); }
    void setPath(std::string path) { path_ = std::move(path); }

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return hash_; }
    std::string description() const override;

  private:
    TGRTDependencyItem(std::string identifier, std::string path);

    std::string identifier_;
    std::string path_;
    std::size_t hash_;
};

}  // namespace qvct
