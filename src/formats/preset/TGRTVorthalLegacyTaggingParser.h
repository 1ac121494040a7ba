#pragma once

#include "platform/base/ObjectSet.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTag.h"
#include "taxonomy/TGRTTagging.h"

#include <string>
#include <string_view>
#include <unordered_map>

namespace qvct {

/// Reads the tags of synth presets that older versions wrote: a line of the preset's text that begins with
/// "Attribs = " and lists codes, separated by commas without blanks.
///
/// A file that cannot be read as UTF-8, or has no such line, has no tags; codes that nobody knows are passed
/// over. Safe from every thread. Tags and taggings of the retired vocabulary refer to its shared taxonomy.
class TGRTVorthalLegacyTaggingParser {
  public:
    struct LegacyTag {
        std::string category;
        std::string label;
        std::string parent;  ///< empty for a root tag
        bool operator==(const LegacyTag&) const = default;
    };
    /// Code → the tag that it stands for.
    static const std::unordered_map<std::string, LegacyTag>& legacyTagIdMapping();

    /// Of several such lines the first counts.
    static ObjectSet<TGRTTag> legacyTagsForFileURL(const URL& url);
    /// The same as taggings without level.
    static ObjectSet<TGRTTagging> legacyFormatTaggingsForFileURL(const URL& url);
    /// What the tags have become in the default taxonomy.
    static ObjectSet<TGRTTagging> mappedTaggingsForFileURL(const URL& url);

    // The same for a preset that has been read already. Text that is not UTF-8 has no tags.

    static ObjectSet<TGRTTag> legacyTagsForText(std::string_view text);
    static ObjectSet<TGRTTagging> legacyFormatTaggingsForText(std::string_view text);
    static ObjectSet<TGRTTagging> mappedTaggingsForText(std::string_view text);
};

}  // namespace qvct
