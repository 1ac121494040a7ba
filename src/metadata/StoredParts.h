#pragma once

#include "metadata/TGRTContentInfo.h"
#include "metadata/TGRTKeyValue.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "taxonomy/TGRTTagging.h"

namespace qvct {

// The parts of a record as they are to be stored where something is stored already (null for nothing).
//
// What a part holds is told from what stands there: entries that it still holds stay as they are, those that
// it holds no more go, others are added, and one that changed is changed in place, whatever else it carries.
// So everything that is not understood stays: entries of strange types, strange keys of entries and of the
// part. An array that changes is put into its written order, what is not understood behind the rest. A stored
// value of another type counts as absent, and gives way only to a part that is not empty.

/// @cost  All of them O(stored + held).
PropertyList storedTaggings(const PropertyList* stored, const ObjectSet<TGRTTagging>& taggings);
PropertyList storedContentInfo(const PropertyList* stored, const TGRTContentInfo& contentInfo);
PropertyList storedKeyValues(const PropertyList* stored, const ObjectSet<TGRTKeyValue>& keyValues);

}  // namespace qvct
