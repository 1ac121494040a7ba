#pragma once

#include "contentdb/Explanation.h"

#include <string>
#include <string_view>

namespace qvct::contentdb {

/// The bytes that `IndexedItem::explanation` holds, some 5 for each claim: a word of a name is kept as its
/// place in the item's path.
std::string encodedExplanation(const Explanation& explanation, std::string_view path);
/// Fills in what `encodedExplanation` wrote, but for the labels of the claims for tags that hold. False when
/// the bytes are no such explanation.
bool decodeExplanation(std::string_view bytes, std::string_view path, Explanation& explanation);

}  // namespace qvct::contentdb
