#include "formats/bundle/TGRTPatchMetaDataReader.h"

#include "formats/QVContentEditorFileUtilities.h"
#include "formats/bundle/BundleRecord.h"
#include "platform/base/Log.h"
#include "platform/data/xml/XmlDocument.h"

#include <array>

#include <fmt/format.h>

namespace qvct {

bool TGRTPatchMetaDataReader::supportsFileExtension(std::string_view extension) {
    constexpr std::array<std::string_view, 1> extensions = {"patch"};
    return isExtensionIn(extension, extensions);
}

std::shared_ptr<TGRTMetaData> TGRTPatchMetaDataReader::readMetaDataFromURL(const URL& url,
                                                                           std::uint64_t options,
                                                                           Error* error) const {
    auto record = TGRTBundleMetaDataReader::readMetaDataFromURL(url, options, error);
    if (!record && (options & kReadUntaggedPatch) != 0) record = TGRTMetaData::init();
    if (!record) return nullptr;
    record->setFileType(defaultFileType());
    if (record->subFileType() == 0) record->setSubFileType(patchSubTypeFromTaggings(record->taggings()));
    return record;
}

std::int64_t TGRTPatchMetaDataReader::patchSubTypeFromTaggings(const ObjectSet<TGRTTagging>& taggings) {
    return firstSubType(kPatchSubTypes, taggings);
}

ObjectSet<TGRTTagging> TGRTPatchMetaDataReader::pluginTaggingsForURL(const URL& url) {
    ObjectSet<TGRTTagging> taggings;
    const auto cache = QVContentEditorFileUtilities::intermediateCacheURLForURL(url);
    const auto description = cache ? XmlDocument::fromFile(cache->path()) : nullptr;
    if (!description) return taggings;
    const auto taxonomy = TGRTTaxonomy::mutableDefaultTaxonomy();
    for (const std::string& name : description->attributeValues(
             "/Patch/Channels/Channel/Plugins/Plugin[contains(@bypassed,'0')]", "name")) {
        if (name.empty()) continue;
        // Not QVCategoryPlugInsIdentifier: names of plug-ins as they come stay apart from the curated tags.
        const auto tag = taxonomy->findOrCreateTagWithLabel(name, "Plugins");
        taggings.insert(TGRTTagging::initWithTag(tag, nullptr));
        log(fmt::format("pluginName {}", name));
    }
    return taggings;
}

}  // namespace qvct
