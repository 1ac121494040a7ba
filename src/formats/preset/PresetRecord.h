#pragma once

#include "formats/preset/PresetText.h"
#include "metadata/TGRTMetaData.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <set>
#include <string>

namespace qvct {

// The record of a preset, to and from the items of its text.

/// Labels are resolved in the taxonomy. Items that make no sense are passed over.
std::shared_ptr<TGRTMetaData> recordOfPreset(const PresetText& preset, TGRTTaxonomy& taxonomy);

/// Replaces the stored taggings and removes the stored UUID.
void setTaggings(PresetText& preset, const ObjectSet<TGRTTagging>& taggings);
void setContentInfo(PresetText& preset, const TGRTContentInfo& contentInfo);
void setRejectedLabels(PresetText& preset, const std::set<std::string>& labels);
/// Replaces display name and key values, and the sub type unless the record has none.
void setDescription(PresetText& preset, const TGRTMetaData& record);

/// The text without the sections that hold a record: it stays the same whatever record is written.
std::string textWithoutRecord(const PresetText& preset);

}  // namespace qvct
