#pragma once

#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <string_view>

namespace qvct {

/// The tag of a retired vocabulary with a label, below the parent with `parentLabel`; for an empty parent
/// label the root tag.
///
/// A plain search without parent would not do: it goes depth first, and the retired vocabularies have one
/// word both as a root and below others ("Bass", and "Bass" below "Rhythmic"). Where no root tag has the
/// label, the result is that of the plain search.
std::shared_ptr<TGRTTag> findLegacyTag(const TGRTTaxonomy& taxonomy, std::string_view label,
                                       std::string_view parentLabel, std::string_view categoryIdentifier);

}  // namespace qvct
