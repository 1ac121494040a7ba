#include "Resources.h"

#include "ToolContext.h"
#include "platform/FileAccess.h"
#include "platform/PropertyListFile.h"
#include "platform/ResourceBundle.h"
#include "platform/Text.h"

#include <array>
#include <string_view>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

struct Resource {
    std::string_view name;
    std::string_view extension;
    /// The key without which a property list is not the resource; empty where any dictionary will do.
    std::string_view requiredKey;
};

constexpr std::array<Resource, 9> kResources = {{{"DefaultTaxonomy", "plist", "categories"},
                                                 {"DefaultRules", "plist", "DefaultRules"},
                                                 {"DefaultKeywordMapping", "plist", ""},
                                                 {"LegacyLoopTaxonomy", "plist", "categories"},
                                                 {"LegacyVorthalTaxonomy", "plist", "categories"},
                                                 {"LegacyLoopTaxonomyMapping", "csv", ""},
                                                 {"LegacyVorthalTaxonomyMapping", "csv", ""},
                                                 {"PackDisplayNames", "csv", ""},
                                                 {"QVSearchKit", "js", ""}}};

bool isUsablePropertyList(const std::string& path, std::string_view requiredKey, Error& error) {
    const auto dictionary = readDictionaryFile(path, &error);
    if (!dictionary) return false;
    if (requiredKey.empty()) return true;
    const PropertyList* value = dictionary->value(requiredKey);
    const bool isList = requiredKey == "DefaultRules";
    if (value != nullptr && (isList ? value->array() != nullptr : value->dictionary() != nullptr))
        return true;
    return fail(
        &error, kErrorMalformed,
        fmt::format("{}: {} \"{}\"", printable(path),
                    value == nullptr ? "there is no key" : "there are no entries under", requiredKey));
}

bool isUsable(const Resource& resource, const std::string& path, Error& error) {
    if (resource.extension == "plist") return isUsablePropertyList(path, resource.requiredKey, error);
    return readTextFile(path, &error).has_value();
}

void checkResource(const Resource& resource, ToolContext& context) {
    const auto path = ResourceBundle::pathForResource(resource.name, resource.extension);
    Error error;
    if (!path || isUsable(resource, *path, error)) return;
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
    for (const Resource& resource : kResources) checkResource(resource, context);
}

}  // namespace qvct::tool
