#include "autotagging/services/QVCTSoftwareInstrumentTaggingService.h"

#include "autotagging/scripts/QVCTJavaScriptUtilities.h"
#include "platform/files/FileAccess.h"
#include "resources/QVCTCompiledResources.h"
#include "resources/ReplacementFile.h"

#include <utility>

namespace qvct {
namespace {

std::string script() {
    const auto read = [](const std::string& path) { return readTextFile(path); };
    return replacedOrBuiltIn({"ExtractSoftwareInstrumentsRule", "js"}, read,
                             QVCTCompiledResources::ExtractSoftwareInstrumentsRuleJS)
        .value_or("");
}

}  // namespace

std::shared_ptr<QVCTSoftwareInstrumentTaggingService> QVCTSoftwareInstrumentTaggingService::init() {
    return std::shared_ptr<QVCTSoftwareInstrumentTaggingService>(
        new QVCTSoftwareInstrumentTaggingService(script()));
}

TagDictionarySet QVCTSoftwareInstrumentTaggingService::tagsWithContentsOfURL(
    const URL& /*url*/, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& /*fileData*/,
    std::uint64_t options) {
    TagDictionarySet tags;
    if ((options & QVCTAutoTaggingOptionSoftwareInstruments) == 0 || script_.empty()) return tags;
    auto result = QVCTJavaScriptUtilities::tagsForXMLDocument(xmlDocument, script_);
    if (!result) return tags;
    for (PropertyList& element : *result) {
        if (TagDictionary* dictionary = element.dictionary()) tags.insert(std::move(*dictionary));
    }
    return tags;
}

}  // namespace qvct
