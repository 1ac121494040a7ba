#include "autotagging/services/QVCTSoftwareInstrumentTaggingService.h"

#include "autotagging/scripts/QVCTJavaScriptUtilities.h"
#include "platform/files/FileAccess.h"
#include "platform/files/ResourceBundle.h"
#include "resources/QVCTCompiledResources.h"

#include <utility>

namespace qvct {
namespace {

std::string script() {
    if (const auto path = ResourceBundle::pathForResource("ExtractSoftwareInstrumentsRule", "js")) {
        if (auto text = readTextFile(*path)) return *std::move(text);
    }
    return QVCTCompiledResources::ExtractSoftwareInstrumentsRuleJS().value_or("");
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
