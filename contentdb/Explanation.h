#pragma once

#include "autotagging/evidence/ClaimResolver.h"
#include "contentdb/IndexedItem.h"
#include "platform/base/Export.h"

#include <cstddef>
#include <optional>
#include <vector>

namespace qvct::contentdb {

/// Why an item has the tags that services gave it, and what they said that does not hold, as `ItemTagger`
/// told it when the item was indexed.
struct Explanation {
    /// A tagging of the item that holds by what services say; its record may say the same.
    struct Held {
        std::size_t tagging = 0;  ///< Which of the item's, from 0.
        double confidence = 1;    ///< In [0, 1], in thousandths.
        /// The surest first, without levels; none for a parent that its child brings.
        std::vector<TagClaim> claims;
    };

    /// False where no more is known than the tags that hold, and at best the surest evidence for each: of
    /// items that were indexed without naming habits, whose services are not weighed, or by an earlier
    /// edition.
    bool isWhole = false;
    SoundKind kind = SoundKind::unsaid;
    std::optional<double> tempo;      ///< Beats a minute that the item's names state, in thousandths.
    bool isTempoFromLength = false;   ///< A number of the name that the length of the sound agrees with.
    std::optional<int> beats;         ///< How long the item is said to be, at least 0.
    std::vector<Held> held;           ///< The surest first.
    std::vector<DroppedTag> dropped;  ///< By label.
};

/// What the database keeps of the reasons for an item's tags; its file is not needed. Evidence that is longer
/// than 80 bytes, as of some rules, is cut short.
/// @cost  O(claims).
QVCT_API Explanation explanationOf(const IndexedItem& item);

}  // namespace qvct::contentdb
