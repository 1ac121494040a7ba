#pragma once

#include "platform/base/Export.h"

#include <memory>
#include <set>
#include <string>
#include <vector>

namespace qvct {

class TGRTTag;

/// The tags that a person rejected for an item: in its record, or for a folder that it lies in.
///
/// A tag is rejected with all tags below it. What a person said of the item itself outranks that.
class QVCT_API Rejections {
  public:
    using Labels = std::set<std::string>;

    /// `where` they were rejected, as it follows that word: "in its record". Null labels are none.
    void add(std::shared_ptr<const Labels> labels, std::string where);
    /// A person gave the item this tag: neither it nor a tag above it is rejected.
    void except(const TGRTTag& tag);

    bool empty() const { return sources_.empty(); }
    /// Why the tag is rejected: "rejected in its record", "Drums is rejected in its record" for a tag below
    /// Drums. Empty when it is not. Of several reasons the one that was added first.
    /// @cost  O(sources · tags above it · log labels).
    std::string reasonFor(const TGRTTag& tag) const;

  private:
    struct Source {
        std::shared_ptr<const Labels> labels;
        std::string where;
    };

    std::vector<Source> sources_;
    Labels excepted_;
};

}  // namespace qvct
