#pragma once

#include "autotagging/evidence/EvidenceWeights.h"
#include "autotagging/evidence/SoundKind.h"
#include "autotagging/evidence/TagClaim.h"
#include "platform/base/Export.h"

#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace qvct {

class TGRTTag;
class TGRTTagging;
class TGRTTaxonomy;

/// A tag that holds, with all that speaks for it.
struct QVCT_API HeldTag {
    std::shared_ptr<TGRTTag> tag;
    std::optional<double> level;
    double confidence = 0;
    std::vector<TagClaim> claims;  ///< The surest first; none for a parent that its child brings.

    /// Marked as automatic.
    std::shared_ptr<TGRTTagging> tagging() const;
};

/// A tag that was claimed and does not hold.
struct DroppedTag {
    std::string label;
    double confidence = 0;
    std::string reason;
    std::vector<TagClaim> claims;
};

/// What holds, and what does not.
struct Resolution {
    std::vector<HeldTag> held;  ///< The surest first, then by label.
    std::vector<DroppedTag> dropped;
};

/// Decides which of several claims hold. The rules are in docs/evidence.md.
///
/// The order of the claims makes no difference. Immutable, so it may be shared by threads that do not change
/// the taxonomy.
/// @cost  Some microseconds for an ordinary item; O(claims + tags²).
class QVCT_API ClaimResolver {
  public:
    /// For the labels of that taxonomy.
    explicit ClaimResolver(std::shared_ptr<const TGRTTaxonomy> taxonomy,
                           EvidenceWeights weights = EvidenceWeights::defaultWeights());

    /// A one-shot has one instrument at most.
    Resolution resolve(std::vector<TagClaim> claims, SoundKind kind) const;
    const EvidenceWeights& weights() const { return weights_; }

  private:
    std::shared_ptr<const TGRTTaxonomy> taxonomy_;
    EvidenceWeights weights_;
};

}  // namespace qvct
