#include "Resources.h"

#include "ToolContext.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "platform/files/ResourceBundle.h"
#include "platform/text/Text.h"
#include "resources/ResourceFiles.h"
#include "taxonomy/LegacyMappingTable.h"
#include "taxonomy/TGRTLegacyTaxonomyMapping.h"

#include <string_view>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

constexpr std::string_view kRulesKey = "DefaultRules";

/// The key without which a property list is not the resource; empty where any dictionary will do.
std::string_view requiredKey(std::string_view resource) {
    if (resource == kRulesKey) return resource;
    return resource.ends_with("Taxonomy") ? "categories" : "";
}

std::optional<PropertyList::Dictionary> readDictionaryWith(std::string_view key, const std::string& path,
                                                           Error* error) {
    auto dictionary = readDictionaryFile(path, error);
    if (!dictionary || key.empty()) return dictionary;
    const PropertyList* value = dictionary->value(key);
    const bool isList = key == kRulesKey;
    if (value != nullptr && (isList ? value->array() != nullptr : value->dictionary() != nullptr))
        return dictionary;
    fail(error, kErrorMalformed,
         fmt::format("{}: {} \"{}\"", printable(path),
                     value == nullptr ? "there is no key" : "there are no entries under", key));
    return std::nullopt;
}

bool isMappingTable(std::string_view text, const std::string& path, Error* error) {
    const auto lines = split(replaceAll(text, "\r\n", "\n"), "\n");
    if (lines.front() != kLegacyMappingHeader)
        return fail(error, kErrorMalformed, fmt::format("{}, line 1: is not the header", printable(path)));
    for (std::size_t i = 1; i < lines.size(); ++i) {
        if (lines[i].empty() || TGRTLegacyTaxonomyMapping::correctFormatForLine(lines[i])) continue;
        return fail(error, kErrorMalformed,
                    fmt::format("{}, line {}: has not {} fields", printable(path), i + 1,
                                std::size_t{kLegacyMappingFieldCount}));
    }
    return true;
}

bool isUsableText(const ResourceFile& resource, const std::string& path, Error* error) {
    const auto text = readTextFile(path, error);
    return text && (!resource.name.ends_with("TaxonomyMapping") || isMappingTable(*text, path, error));
}

bool isUsable(const ResourceFile& resource, const std::string& path, ToolContext& context, Error* error) {
    if (resource.extension != "plist") return isUsableText(resource, path, error);
    const auto dictionary = readDictionaryWith(requiredKey(resource.name), path, error);
    if (dictionary && resource.name == "DefaultKeywordMapping") checkKeywords(*dictionary, context);
    return dictionary.has_value();
}

void checkResource(const ResourceFile& resource, ToolContext& context) {
    const auto path = ResourceBundle::pathForResource(resource.name, resource.extension);
    Error error;
    if (!path || isUsable(resource, *path, context, &error)) return;
    context.itemFailed(fmt::format("{} (using the built-in one)", error.message));
    ResourceBundle::setPathForResource(resource.name, resource.extension, std::nullopt);
}

}  // namespace

void useResources(const std::string& directory, const std::string& taxonomyFile, ToolContext& context) {
    if (!directory.empty()) ResourceBundle::setDirectory(directory);
    const std::string folder = ResourceBundle::directory();
    if (!folder.empty() && !isDirectory(folder)) {
        context.itemFailed(fmt::format("{}: no such resource folder", printable(folder)));
    }
    if (!taxonomyFile.empty()) ResourceBundle::setPathForResource("DefaultTaxonomy", "plist", taxonomyFile);
    for (const ResourceFile& resource : kResourceFiles) checkResource(resource, context);
}

std::optional<PropertyList::Dictionary> readRules(const std::string& path, Error* error) {
    return readDictionaryWith(kRulesKey, path, error);
}

void checkKeywords(const PropertyList::Dictionary& mapping, ToolContext& context) {
    for (const auto& [keyword, _] : mapping) {
        if (!QVCTKeywordExtractor::regexForKeyword(keyword)) context.loggedFailure();
    }
}

}  // namespace qvct::tool
