#include "autotagging/services/QVCTSoundTaggingService.h"

#include "autotagging/evidence/SoundClaims.h"
#include "formats/ItemFile.h"
#include "listening/Listener.h"
#include "resources/DefaultListeningModels.h"

namespace qvct {
namespace {

/// Below it a claim alone is no tag.
constexpr double kLikely = 0.5;

}  // namespace

QVCTSoundTaggingService::QVCTSoundTaggingService() = default;
QVCTSoundTaggingService::~QVCTSoundTaggingService() = default;

std::vector<TagClaim> QVCTSoundTaggingService::claimsOfFile(ItemFile& file,
                                                            const std::shared_ptr<LCFileData>& fileData,
                                                            std::uint64_t options) {
    if ((options & QVCTAutoTaggingOptionSound) == 0 || !fileData) return {};
    if (!listener_) listener_ = std::make_unique<Listener>(defaultListeningModels());
    const auto sound = file.sound(*listener_);
    return sound ? claimsOfSound(*sound) : std::vector<TagClaim>();
}

std::vector<TagClaim> QVCTSoundTaggingService::claims(const TaggedItem& item, std::uint64_t options) {
    return claimsOfFile(item.file, item.fileData, options);
}

TagDictionarySet QVCTSoundTaggingService::tagsWithContentsOfFile(
    ItemFile& file, const std::shared_ptr<QVCTXMLDocument>& /*xmlDocument*/,
    const std::shared_ptr<TGRTMetaData>& /*metaData*/, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    TagDictionarySet tags;
    for (const TagClaim& claim : claimsOfFile(file, fileData, options))
        if (claim.confidence >= kLikely) tags.insert(tagDictionary(claim.label, claim.level));
    return tags;
}

TagDictionarySet QVCTSoundTaggingService::tagsWithContentsOfURL(
    const URL& url, const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
    const std::shared_ptr<TGRTMetaData>& metaData, const std::shared_ptr<LCFileData>& fileData,
    std::uint64_t options) {
    ItemFile file(url);
    return tagsWithContentsOfFile(file, xmlDocument, metaData, fileData, options);
}

}  // namespace qvct
