#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>
#include <string>

namespace qvct {

/// Tags a patch with its active software instruments, by the names of their plug-ins.
///
/// The script `ExtractSoftwareInstrumentsRule.js` of the resource folder, or else the one inside the library,
/// decides what counts as one. Immutable: safe from every thread, each with documents of its own.
class QVCTSoftwareInstrumentTaggingService : public QVCTAutoTaggingService {
  public:
    static std::shared_ptr<QVCTSoftwareInstrumentTaggingService> init();

    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::string_view name() const override { return "instruments"; }

  private:
    explicit QVCTSoftwareInstrumentTaggingService(std::string script) : script_(std::move(script)) {}

    std::string script_;
};

}  // namespace qvct
