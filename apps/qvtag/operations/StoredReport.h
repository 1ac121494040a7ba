#pragma once

#include "autotagging/ItemTagger.h"
#include "contentdb/IndexedItem.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

namespace qvct::tool {

/// What an item's tags are, and why.
struct ExplainedItem {
    ObjectSet<TGRTTagging> stored;     ///< In its record.
    ObjectSet<TGRTTagging> following;  ///< From the record and the file; only databases keep them.
    ItemReport report;
};

/// As a database keeps it. Tags that the taxonomy does not have are made in it.
ExplainedItem storedReport(const contentdb::IndexedItem& item, TGRTTaxonomy& taxonomy);

}  // namespace qvct::tool
