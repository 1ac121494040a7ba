#include "Resources.h"

#include "ToolContext.h"
#include "platform/FileAccess.h"
#include "platform/PropertyListFile.h"
#include "platform/ResourceBundle.h"
#include "platform/Text.h"
#include "resources/ResourceFiles.h"

#include <string_view>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

/// The key without which a property list is not the resource; empty where any dictionary will do.
std::string_view requiredKey(std::string_view resource) {
    if (resource == "DefaultRules") return resource;
    return resource.ends_with("Taxonomy") ? "categories" : "";
}

bool isUsablePropertyList(const std::string& path, std::string_view key, Error& error) {
    const auto dictionary = readDictionaryFile(path, &error);
    if (!dictionary) return false;
    if (key.empty()) return true;
    const PropertyList* value = dictionary->value(key);
    const bool isList = key == "DefaultRules";
    if (value != nullptr && (isList ? value->array() != nullptr : value->dictionary() != nullptr))
        return true;
    return fail(&error, kErrorMalformed,
                fmt::format("{}: {} \"{}\"", printable(path),
                            value == nullptr ? "there is no key" : "there are no entries under", key));
}

bool isUsable(const ResourceFile& resource, const std::string& path, Error& error) {
    if (resource.extension == "plist") return isUsablePropertyList(path, requiredKey(resource.name), error);
    return readTextFile(path, &error).has_value();
}

void checkResource(const ResourceFile& resource, ToolContext& context) {
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
    for (const ResourceFile& resource : kResourceFiles) checkResource(resource, context);
}

}  // namespace qvct::tool
