#pragma once

#include "metadata/TGRTContentInfo.h"
#include "metadata/TGRTKeyValue.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "taxonomy/TGRTTagging.h"

#include <optional>
#include <set>
#include <string>

namespace qvct {

// The parts of a record as they are to be stored where something is stored already (null for nothing).
//
// A part is compared with what is stored: entries that it still holds stay as they are, others are removed,
// new ones are added, and changed ones are changed in place, keeping whatever else they carry. So everything
// that is not understood stays: entries of unknown types, unknown keys of entries and of the part. An array
// that changes is put into the order in which arrays are written, with what is not understood behind the
// rest. A stored value of another type counts as absent, and is replaced only by a part that is not empty.

/// @cost  All of them O(stored + held).
PropertyList storedTaggings(const PropertyList* stored, const ObjectSet<TGRTTagging>& taggings);
PropertyList storedContentInfo(const PropertyList* stored, const TGRTContentInfo& contentInfo);
PropertyList storedKeyValues(const PropertyList* stored, const ObjectSet<TGRTKeyValue>& keyValues);
/// Nothing when nothing is to be stored.
std::optional<PropertyList> storedRejections(const PropertyList* stored, const std::set<std::string>& labels);

/// The texts of a stored array of rejected labels; none for null or another value.
std::set<std::string> rejectedLabels(const PropertyList* stored);
/// Puts what `storedRejections` answers into a stored dictionary.
void storeRejections(PropertyList::Dictionary& stored, const std::set<std::string>& labels);

}  // namespace qvct
