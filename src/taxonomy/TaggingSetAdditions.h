#pragma once

#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "taxonomy/TGRTTagging.h"

#include <memory>
#include <string_view>

namespace qvct {

// Finding and replacing taggings of a set by their label.

/// The first tagging with that label, or null.
QVCT_API std::shared_ptr<TGRTTagging> anyTaggingForLabel(const ObjectSet<TGRTTagging>& taggings,
                                                         std::string_view label);
/// Whether a tagging has that label.
QVCT_API bool containsTagWithLabel(const ObjectSet<TGRTTagging>& taggings, std::string_view label);

/// Replaces the tagging with a label by one of a new tag with the new label, which joins the old tag's parent
/// and category. The level stays; the new tagging is no automatic one.
///
/// Where the parent has a tag of the new label already, the new tag takes its place among the parent's
/// children, and it has no children of its own: those of the tag that was there are lost when the taxonomy is
/// next written.
/// @return  Whether there was one. False, too, when nothing is left of the new label without its markers.
QVCT_API bool renameTagWithLabel(ObjectSet<TGRTTagging>& taggings, std::string_view label,
                                 std::string_view newLabel);

/// Replaces the tagging with a label by one of another tag, in the same way.
QVCT_API bool reassignTagWithLabel(ObjectSet<TGRTTagging>& taggings, std::string_view label,
                                   const std::shared_ptr<TGRTTag>& tag);

}  // namespace qvct
