#pragma once

#include "platform/base/Export.h"
#include "platform/base/Object.h"

#include <memory>
#include <string>

namespace qvct {

/// The weight with which a tag applies to content.
class QVCT_API TGRTLevel : public Object {
  public:
    /// A level of that weight, clamped to [0, 1]. Its identity is that of the weight as given: levels made
    /// from 1.5 and from 1.0 weigh the same but are not equal. A weight that is not a number counts as 0.
    static std::shared_ptr<TGRTLevel> levelWithWeight(double weight);

    double weight() const { return weight_; }
    /// Does not change hash and equality, which are those of the weight at creation.
    void setWeight(double weight) { weight_ = weight; }
    /// A text of the host's own; empty unless a host's subclass says otherwise.
    virtual std::string displayString() const { return {}; }

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return hash_; }
    std::string description() const override;

  protected:
    /// As `levelWithWeight`.
    explicit TGRTLevel(double weight);

  private:
    std::size_t hash_;
    double weight_;
};

}  // namespace qvct
