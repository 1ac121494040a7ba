#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <memory>

namespace qvct {

class Listener;

/// Tags from what can be heard in an audio file; see docs/listening.md.
///
/// Decodes the beginning of the file. Use from one thread at a time. Says nothing of files that cannot be
/// decoded.
class QVCTSoundTaggingService : public QVCTAutoTaggingService {
  public:
    QVCTSoundTaggingService();
    ~QVCTSoundTaggingService() override;

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
    std::vector<TagClaim> claims(const TaggedItem& item, std::uint64_t options) override;
    std::string_view name() const override { return "sound"; }

  private:
    std::vector<TagClaim> claimsOfFile(ItemFile& file, const std::shared_ptr<LCFileData>& fileData,
                                       std::uint64_t options);

    std::unique_ptr<Listener> listener_;  // since most aggregators are never asked to listen
};

}  // namespace qvct
