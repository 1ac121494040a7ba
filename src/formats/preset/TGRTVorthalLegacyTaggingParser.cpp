#include "formats/preset/TGRTVorthalLegacyTaggingParser.h"

#include "formats/preset/VorthalLegacyCodes.h"
#include "platform/base/Log.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/legacy/LegacyTagLookup.h"
#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include <algorithm>
#include <array>
#include <string_view>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kToken = "Attribs = ";
/// What ends a line in Unicode text.
constexpr std::array<std::string_view, 5> kLineBreaks = {"\n", "\r", "\xc2\x85", "\xe2\x80\xa8",
                                                         "\xe2\x80\xa9"};

/// The line around an offset, without what ends it.
std::string_view lineAround(std::string_view text, std::size_t offset) {
    std::size_t start = 0;
    std::size_t end = text.size();
    for (const std::string_view lineBreak : kLineBreaks) {
        const std::size_t before = text.substr(0, offset).rfind(lineBreak);
        if (before != std::string_view::npos) start = std::max(start, before + lineBreak.size());
        end = std::min(end, text.find(lineBreak, offset));
    }
    return text.substr(start, end - start);
}

/// The codes of the first attribute line. The token is assumed to begin its line: as many characters as it
/// has are cut from the line's start, wherever it stands.
std::vector<std::string> attributeCodes(std::string_view text) {
    const std::size_t token = text.find(kToken);
    if (token == std::string_view::npos) return {};
    const std::u16string line = utf16FromUtf8(lineAround(text, token));
    return split(utf8FromUtf16(std::u16string_view(line).substr(kToken.size())), ",");
}

}  // namespace

const std::unordered_map<std::string, TGRTVorthalLegacyTaggingParser::LegacyTag>&
TGRTVorthalLegacyTaggingParser::legacyTagIdMapping() {
    static const auto mapping = [] {
        std::unordered_map<std::string, LegacyTag> table;
        for (const VorthalLegacyCode& row : vorthalLegacyCodes()) {
            table.try_emplace(
                std::string(row.code),
                LegacyTag{std::string(row.category), std::string(row.label), std::string(row.parent)});
        }
        return table;
    }();
    return mapping;
}

ObjectSet<TGRTTag> TGRTVorthalLegacyTaggingParser::legacyTagsForText(std::string_view text) {
    ObjectSet<TGRTTag> tags;
    if (!isValidUtf8(text)) return tags;
    const auto taxonomy = TGRTTaxonomy::legacyVorthalTaxonomy();
    for (const std::string& code : attributeCodes(text)) {
        const auto known = legacyTagIdMapping().find(code);
        if (known == legacyTagIdMapping().end()) continue;
        const auto& [category, label, parent] = known->second;
        auto tag = findLegacyTag(*taxonomy, label, parent, category);
        if (!tag) log(fmt::format("not found: label:{} parent:{} category:{}", label, parent, category));
        tags.insert(std::move(tag));
    }
    return tags;
}

ObjectSet<TGRTTagging> TGRTVorthalLegacyTaggingParser::legacyFormatTaggingsForText(std::string_view text) {
    ObjectSet<TGRTTagging> taggings;
    for (const auto& tag : legacyTagsForText(text)) taggings.insert(TGRTTagging::initWithTag(tag, nullptr));
    return taggings;
}

ObjectSet<TGRTTagging> TGRTVorthalLegacyTaggingParser::mappedTaggingsForText(std::string_view text) {
    ObjectSet<TGRTTagging> taggings;
    const auto mapping = TGRTLegacyTaxonomyMapping::legacyVorthalTaxonomyMapping();
    if (!mapping) return taggings;
    for (const auto& tag : legacyTagsForText(text)) taggings.insertAll(mapping->taggingsForLegacyTag(*tag));
    return taggings;
}

ObjectSet<TGRTTag> TGRTVorthalLegacyTaggingParser::legacyTagsForFileURL(const URL& url) {
    return legacyTagsForText(readTextFile(url.path()).value_or(""));
}

ObjectSet<TGRTTagging> TGRTVorthalLegacyTaggingParser::legacyFormatTaggingsForFileURL(const URL& url) {
    return legacyFormatTaggingsForText(readTextFile(url.path()).value_or(""));
}

ObjectSet<TGRTTagging> TGRTVorthalLegacyTaggingParser::mappedTaggingsForFileURL(const URL& url) {
    return mappedTaggingsForText(readTextFile(url.path()).value_or(""));
}

}  // namespace qvct
