#include "Resources.h"

#include "ToolContext.h"
#include "autotagging/ResourceFiles.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/FileAccess.h"
#include "platform/files/ResourceBundle.h"
#include "resources/ResourceDictionary.h"

namespace qvct::tool {

void useResources(const std::string& directory, const std::string& taxonomyFile, ToolContext& context) {
    if (!directory.empty()) ResourceBundle::setDirectory(directory);
    const std::string folder = ResourceBundle::directory();
    if (!folder.empty() && !isDirectory(folder)) {
        context.itemFailed(errorOf(kErrorUnreadable, "no such resource folder", {folder}));
    }
    if (!taxonomyFile.empty()) ResourceBundle::setPathForResource("DefaultTaxonomy", "plist", taxonomyFile);
    for (const ResourceFile& resource : resourceFiles()) {
        Error error;
        const auto path = replacementFile(resource, &error);
        if (error.isSet()) context.itemFailed(error);
        const bool isMapping = path && resource.name == "DefaultKeywordMapping";
        if (const auto mapping = isMapping ? readDictionaryFile(*path) : std::nullopt)
            checkKeywords(*mapping, context);
    }
}

std::optional<PropertyList::Dictionary> readRules(const std::string& path, Error* error) {
    return readResourceDictionary("DefaultRules", path, error);
}

void checkKeywords(const PropertyList::Dictionary& mapping, ToolContext& context) {
    for (const auto& [keyword, _] : mapping) {
        if (!QVCTKeywordExtractor::regexForKeyword(keyword)) context.loggedFailure();
    }
}

}  // namespace qvct::tool
