#pragma once

#include "platform/base/Export.h"

#include <string>
#include <string_view>
#include <vector>

namespace qvct {

class ContentItem;
struct ItemReport;
class TGRTTaxonomy;

/// Two things that are said of an item and cannot both be so.
struct Contradiction {
    /// What one source says.
    struct Statement {
        std::string value;        ///< "124 bpm", "A minor", "Kick".
        std::string_view source;  ///< "record", "file", "name" or "sound".
        double confidence = 1;    ///< That it is so, in [0, 1], as far as the source can tell.
    };

    std::string_view subject;  ///< "tempo", "length", "key", "root note", "instrument" or "kind".
    Statement stated;          ///< What outranks the other one.
    Statement against;
};

/// What the record, the chunks, the names and the sound of an item say against each other. A person's word in
/// the record outranks the file's chunks, these the names, and those what is heard.
///
/// What is nearly so is none: twice the tempo, the relative key, a tag below the one that is stated. What can
/// be heard counts only where it is clear. `report` is the item's, as `ItemTagger` made it with the service
/// `sound`; without that only statements are compared. Labels are those of the taxonomy.
/// @cost  Some microseconds; reads the record if nobody has.
QVCT_API std::vector<Contradiction> contradictionsIn(ContentItem& item, const ItemReport& report,
                                                     const TGRTTaxonomy& taxonomy);

}  // namespace qvct
