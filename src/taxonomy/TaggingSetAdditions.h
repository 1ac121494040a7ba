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
/// and category. The level stays; the new tagging does not count as automatic.
///
/// If the parent already has a tag of the new label, the new tag replaces it among the parent's children
/// without taking over its children: these are lost when the taxonomy is next written.
/// @return  Whether there was such a tagging. Also false when the new label consists of nothing but markers.
QVCT_API bool renameTagWithLabel(ObjectSet<TGRTTagging>& taggings, std::string_view label,
                                 std::string_view newLabel);

/// Replaces the tagging with a label by one of another tag, in the same way.
QVCT_API bool reassignTagWithLabel(ObjectSet<TGRTTagging>& taggings, std::string_view label,
                                   const std::shared_ptr<TGRTTag>& tag);

}  // namespace qvct
