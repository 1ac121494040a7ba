#pragma once

#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <unordered_set>
#include <vector>

namespace qvct {

/// Translates the tags of a retired vocabulary into taggings of the default taxonomy, as a table says.
///
/// Immutable once made, and safe from every thread. It keeps the default taxonomy that its taggings belong
/// to.
class QVCT_API TGRTLegacyTaxonomyMapping {
  public:
    using Lines = std::vector<std::string>;

    /// The mapping of loop keywords; null when its table comes from a file that is not a valid table. Made
    /// once.
    static std::shared_ptr<const TGRTLegacyTaxonomyMapping> legacyLoopTaxonomyMapping();
    /// The same for the keywords of synth presets.
    static std::shared_ptr<const TGRTLegacyTaxonomyMapping> legacyVorthalTaxonomyMapping();
    /// The resource file with the table; nothing when the compiled-in copy is used.
    static std::optional<URL> defaultLegacyLoopTaxonomyMappingURL();
    /// The same for the table of synth presets.
    static std::optional<URL> defaultLegacyVorthalTaxonomyMappingURL();

    /// The mapping that a table file (UTF-8) holds. Null when there is none, or when its header or the number
    /// of fields of any line is wrong.
    static std::shared_ptr<const TGRTLegacyTaxonomyMapping> initWithTaxonomyMappingFileURL(
        const std::optional<URL>& url, const TGRTTaxonomy& taxonomy);
    /// The mapping of a table's lines, the first of which is passed over, as are lines with another number of
    /// fields. Null for no lines.
    static std::shared_ptr<const TGRTLegacyTaxonomyMapping> initWithLines(const std::optional<Lines>& lines,
                                                                          const TGRTTaxonomy& taxonomy);

    /// What a retired tag has become; empty when the table names nothing, or has no row for it.
    const ObjectSet<TGRTTagging>& taggingsForLegacyTag(const TGRTTag& tag) const;

    // For those who maintain the tables.

    /// Whether a line has as many fields as a row of a table.
    static bool correctFormatForLine(std::string_view line);
    /// Whether the table has a row for the tag, even one that names nothing.
    bool hasRowForLegacyTag(const TGRTTag& tag) const { return rows_.contains(mappingKeyForTag(tag)); }
    /// Type, keyword and sub-keyword, separated by ";", of the rows whose retired tag does not exist.
    const Lines& unknownLegacyKeywords() const { return unknownLegacyKeywords_; }
    /// The new labels that the default taxonomy does not know, once for each occurrence.
    const Lines& unknownNewLabels() const { return unknownNewLabels_; }

  private:
    explicit TGRTLegacyTaxonomyMapping(std::shared_ptr<TGRTTaxonomy> newTaxonomy)
        : newTaxonomy_(std::move(newTaxonomy)) {}

    static bool validFormatForLines(const Lines& lines);
    static std::string mappingKeyForTag(const TGRTTag& tag);

    void mappingWithLines(const Lines& lines, const TGRTTaxonomy& taxonomy);
    std::shared_ptr<TGRTTag> legacyTagForLine(const Lines& fields, const TGRTTaxonomy& taxonomy);
    ObjectSet<TGRTTagging> mappedTaggingsForLine(const Lines& fields);
    std::shared_ptr<TGRTTagging> taggingForString(std::string_view text, const TGRTTaxonomy& taxonomy);

    std::shared_ptr<TGRTTaxonomy> newTaxonomy_;
    std::unordered_map<std::string, ObjectSet<TGRTTagging>> mapping_;
    std::unordered_set<std::string> rows_;
    Lines unknownLegacyKeywords_;
    Lines unknownNewLabels_;
};

}  // namespace qvct
