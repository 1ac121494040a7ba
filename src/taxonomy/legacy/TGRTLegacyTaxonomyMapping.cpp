#include "taxonomy/legacy/TGRTLegacyTaxonomyMapping.h"

#include "platform/base/Log.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"
#include "resources/LegacyMappingTable.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"
#include "taxonomy/legacy/LegacyTagLookup.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

using MappingPointer = std::shared_ptr<const TGRTLegacyTaxonomyMapping>;

constexpr std::string_view kSeparator = ";";

std::optional<URL> tableURL(std::string_view name) {
    const auto path = replacementFile({name, "csv"});
    return path ? std::optional(URL::fileURLWithPath(*path)) : std::nullopt;
}

MappingPointer sharedMapping(const std::optional<URL>& file,
                             std::optional<TGRTLegacyTaxonomyMapping::Lines> (*compiledLines)(),
                             const TGRTTaxonomy& taxonomy) {
    MappingPointer mapping =
        file ? TGRTLegacyTaxonomyMapping::initWithTaxonomyMappingFileURL(file, taxonomy) : nullptr;
    return mapping ? mapping : TGRTLegacyTaxonomyMapping::initWithLines(compiledLines(), taxonomy);
}

}  // namespace

MappingPointer TGRTLegacyTaxonomyMapping::legacyLoopTaxonomyMapping() {
    static const MappingPointer mapping =
        sharedMapping(defaultLegacyLoopTaxonomyMappingURL(), QVCTCompiledResources::LegacyLoopTaxonomyMapping,
                      *TGRTTaxonomy::legacyLoopTaxonomy());
    return mapping;
}

MappingPointer TGRTLegacyTaxonomyMapping::legacyVorthalTaxonomyMapping() {
    static const MappingPointer mapping = sharedMapping(defaultLegacyVorthalTaxonomyMappingURL(),
                                                        QVCTCompiledResources::LegacyVorthalTaxonomyMapping,
                                                        *TGRTTaxonomy::legacyVorthalTaxonomy());
    return mapping;
}

std::optional<URL> TGRTLegacyTaxonomyMapping::defaultLegacyLoopTaxonomyMappingURL() {
    return tableURL("LegacyLoopTaxonomyMapping");
}

std::optional<URL> TGRTLegacyTaxonomyMapping::defaultLegacyVorthalTaxonomyMappingURL() {
    return tableURL("LegacyVorthalTaxonomyMapping");
}

MappingPointer TGRTLegacyTaxonomyMapping::initWithTaxonomyMappingFileURL(const std::optional<URL>& url,
                                                                         const TGRTTaxonomy& taxonomy) {
    if (!url || !fileExists(url->path())) return nullptr;
    const auto text = readTextFile(url->path());
    if (!text) return nullptr;
    const Lines lines = split(replaceAll(*text, "\r\n", "\n"), "\n");
    return validFormatForLines(lines) ? initWithLines(lines, taxonomy) : nullptr;
}

MappingPointer TGRTLegacyTaxonomyMapping::initWithLines(const std::optional<Lines>& lines,
                                                        const TGRTTaxonomy& taxonomy) {
    if (!lines) return nullptr;
    const std::shared_ptr<TGRTLegacyTaxonomyMapping> mapping(
        new TGRTLegacyTaxonomyMapping(TGRTTaxonomy::defaultTaxonomy()));
    mapping->mappingWithLines(*lines, taxonomy);
    return mapping;
}

bool TGRTLegacyTaxonomyMapping::validFormatForLines(const Lines& lines) {
    return !lines.empty() && lines.front() == kLegacyMappingHeader &&
           std::all_of(lines.begin(), lines.end(),
                       [](const std::string& line) { return line.empty() || correctFormatForLine(line); });
}

bool TGRTLegacyTaxonomyMapping::correctFormatForLine(std::string_view line) {
    return std::count(line.begin(), line.end(), kSeparator.front()) + 1 == kLegacyMappingFieldCount;
}

void TGRTLegacyTaxonomyMapping::mappingWithLines(const Lines& lines, const TGRTTaxonomy& taxonomy) {
    for (std::size_t i = 1; i < lines.size(); ++i) {
        if (!correctFormatForLine(lines[i])) continue;
        const Lines fields = split(lines[i], kSeparator);
        const auto tag = legacyTagForLine(fields, taxonomy);
        if (!tag) continue;
        const std::string key = mappingKeyForTag(*tag);
        rows_.insert(key);
        ObjectSet<TGRTTagging> taggings = mappedTaggingsForLine(fields);
        if (!taggings.empty()) mapping_.insert_or_assign(key, std::move(taggings));
    }
}

std::shared_ptr<TGRTTag> TGRTLegacyTaxonomyMapping::legacyTagForLine(const Lines& fields,
                                                                     const TGRTTaxonomy& taxonomy) {
    const std::string& type = fields[kLegacyMappingType];
    const std::string& keyword = fields[kLegacyMappingKeyword];
    const std::string& sub = fields[kLegacyMappingSubKeyword];
    std::shared_ptr<TGRTTag> tag;
    if (!type.empty() && !keyword.empty()) {
        tag = sub.empty() ? findLegacyTag(taxonomy, keyword, {}, type)
                          : findLegacyTag(taxonomy, sub, keyword, type);
    }
    if (!tag) {
        log(fmt::format("No legacy tag found for: {} {} {}", type, keyword, sub));
        unknownLegacyKeywords_.push_back(fmt::format("{};{};{}", type, keyword, sub));
    }
    return tag;
}

ObjectSet<TGRTTagging> TGRTLegacyTaxonomyMapping::mappedTaggingsForLine(const Lines& fields) {
    ObjectSet<TGRTTagging> taggings;
    for (std::size_t i = kLegacyMappingFirstNew; i <= kLegacyMappingLastNew; ++i) {
        taggings.insert(taggingForString(fields[i], *newTaxonomy_));
    }
    return taggings;
}

std::shared_ptr<TGRTTagging> TGRTLegacyTaxonomyMapping::taggingForString(std::string_view text,
                                                                         const TGRTTaxonomy& taxonomy) {
    std::optional<double> weight;
    const std::string label = labelFromString(text, &weight);
    if (label.empty()) return nullptr;
    auto tag = taxonomy.findTagForLabel(label);
    if (!tag) {
        log(fmt::format("Label not found in new taxonomy: {}", label));
        unknownNewLabels_.push_back(label);
        return nullptr;
    }
    // Single precision, as the weights of the tables always were: 0.8 is 0.800000012.
    return TGRTTagging::initWithTag(
        std::move(tag), weight ? TGRTLevel::levelWithWeight(static_cast<float>(*weight)) : nullptr);
}

std::string TGRTLegacyTaxonomyMapping::mappingKeyForTag(const TGRTTag& tag) {
    const auto parent = tag.parent();
    return tag.label() + (parent ? parent->label() : "(null)") + tag.categoryIdentifier();
}

const ObjectSet<TGRTTagging>& TGRTLegacyTaxonomyMapping::taggingsForLegacyTag(const TGRTTag& tag) const {
    static const ObjectSet<TGRTTagging> none;
    const auto hit = mapping_.find(mappingKeyForTag(tag));
    return hit == mapping_.end() ? none : hit->second;
}

}  // namespace qvct
