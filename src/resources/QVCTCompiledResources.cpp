#include "resources/QVCTCompiledResources.h"

#include "platform/base/Log.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Text.h"
#include "resources/EmbeddedFiles.h"

#include <utility>

namespace qvct {
namespace {

using Resource = QVCTCompiledResources::Resource;
using OptionalDictionary = std::optional<PropertyList::Dictionary>;

template <typename T>
std::optional<T> resource(const unsigned char* data, std::uint32_t length, QVCTCompiledResources::Kind kind) {
    Resource made = QVCTCompiledResources::compiledResourceWithData({data, length}, kind);
    T* value = std::get_if<T>(&made);
    return value == nullptr ? std::nullopt : std::optional<T>(std::move(*value));
}

OptionalDictionary dictionary(const unsigned char* data, std::uint32_t length) {
    auto list = resource<PropertyList>(data, length, QVCTCompiledResources::kPropertyList);
    if (!list || list->dictionary() == nullptr) return std::nullopt;
    return std::move(*list->dictionary());
}

std::optional<QVCTCompiledResources::Lines> lines(const unsigned char* data, std::uint32_t length) {
    return resource<QVCTCompiledResources::Lines>(data, length, QVCTCompiledResources::kTextLines);
}

}  // namespace

Resource QVCTCompiledResources::compiledResourceWithData(std::span<const unsigned char> data, int type) {
    if (data.empty()) {
        log("No data");
        return {};
    }
    if (type == kPropertyList) {
        auto list = parsePropertyList(data);
        return list ? Resource(std::move(*list)) : Resource();
    }
    std::string text(data.begin(), data.end());
    if ((type != kText && type != kTextLines) || !isValidUtf8(text)) return {};
    return type == kText ? Resource(std::move(text)) : Resource(split(text, "\n"));
}

OptionalDictionary QVCTCompiledResources::DefaultTaxonomyPlist() {
    return dictionary(DefaultTaxonomy_plist, DefaultTaxonomy_plist_len);
}

OptionalDictionary QVCTCompiledResources::LegacyVorthalTaxonomyPlist() {
    return dictionary(LegacyVorthalTaxonomy_plist, LegacyVorthalTaxonomy_plist_len);
}

OptionalDictionary QVCTCompiledResources::LegacyLoopTaxonomyPlist() {
    return dictionary(LegacyLoopTaxonomy_plist, LegacyLoopTaxonomy_plist_len);
}

OptionalDictionary QVCTCompiledResources::DefaultRulesPlist() {
    return dictionary(DefaultRules_plist, DefaultRules_plist_len);
}

OptionalDictionary QVCTCompiledResources::DefaultKeywordMappingPlist() {
    return dictionary(DefaultKeywordMapping_plist, DefaultKeywordMapping_plist_len);
}

OptionalDictionary QVCTCompiledResources::NamingHabitsPlist() {
    return dictionary(NamingHabits_plist, NamingHabits_plist_len);
}

OptionalDictionary QVCTCompiledResources::EvidenceWeightsPlist() {
    return dictionary(EvidenceWeights_plist, EvidenceWeights_plist_len);
}

std::optional<std::string> QVCTCompiledResources::QVSearchKitJS() {
    return resource<std::string>(QVSearchKit_js, QVSearchKit_js_len, kText);
}

std::optional<std::string> QVCTCompiledResources::ExtractSoftwareInstrumentsRuleJS() {
    return resource<std::string>(ExtractSoftwareInstrumentsRule_js, ExtractSoftwareInstrumentsRule_js_len,
                                 kText);
}

std::optional<QVCTCompiledResources::Lines> QVCTCompiledResources::LegacyLoopTaxonomyMapping() {
    return lines(LegacyLoopTaxonomyMapping_csv, LegacyLoopTaxonomyMapping_csv_len);
}

std::optional<QVCTCompiledResources::Lines> QVCTCompiledResources::LegacyVorthalTaxonomyMapping() {
    return lines(LegacyVorthalTaxonomyMapping_csv, LegacyVorthalTaxonomyMapping_csv_len);
}

std::optional<QVCTCompiledResources::Lines> QVCTCompiledResources::PackDisplayNames() {
    return lines(PackDisplayNames_csv, PackDisplayNames_csv_len);
}

}  // namespace qvct
