#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>

namespace qvct {

/// Translates what an older loop or synth preset says in the retired vocabularies into today's tags.
///
/// Loops: the descriptors, instrument and genre of their chunks. Presets: the attribute codes of their text.
/// Stateless: safe from every thread.
class QVCTTranslateTagsTaggingService : public QVCTAutoTaggingService {
  public:
    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    TagDictionarySet tagsWithContentsOfFile(ItemFile& file,
                                            const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                            const std::shared_ptr<TGRTMetaData>& metaData,
                                            const std::shared_ptr<LCFileData>& fileData,
                                            std::uint64_t options) override;
    std::string_view name() const override { return "translate"; }
};

}  // namespace qvct
