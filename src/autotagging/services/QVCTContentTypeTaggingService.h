#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>

namespace qvct {

/// Tags an item with what it is: a patch and its kind of channel, a loop and its kind, a one shot or a longer
/// sample, a project and its kind, or the kind of a settings file.
///
/// The record says it, where there is one; else the chunks of an audio file; else the extension. A patch's
/// kind of channel is that of its first channel in the XML description, where the record does not name it.
/// Stateless: safe from every thread.
class QVCTContentTypeTaggingService : public QVCTAutoTaggingService {
  public:
    /// Audio that is no loop is a one shot up to this length, a sample above it; neither when its name gives
    /// a tempo.
    static constexpr float kLongestOneShotInSeconds = 10;

    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::string_view name() const override { return "content-type"; }
};

}  // namespace qvct
