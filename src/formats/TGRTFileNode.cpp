#include "formats/TGRTFileNode.h"

#include "formats/ItemFile.h"
#include "formats/TGRTMetaDataReaderFactory.h"
#include "formats/audiofile/TGRTAudioFileTypeValidator.h"
#include "formats/bundle/TGRTBundleTypeValidators.h"
#include "formats/preset/TGRTVorthalPresetTypeValidator.h"
#include "formats/settings/TGRTCstSxvPstTypeValidator.h"

#include <algorithm>
#include <array>

#include <fmt/format.h>

namespace qvct {
namespace {

/// For audio whose extension is that of no content; null for anything else.
std::shared_ptr<TGRTBaseMetaDataReader> readerForAudio(ItemFile& file,
                                                       const std::shared_ptr<TGRTTaxonomy>& taxonomy) {
    const auto audio = file.audio();
    if (!audio) return nullptr;
    if (audio->hasLoopTypeChunks()) return TGRTTavioLoopMetaDataReader::initWithTaxonomy(taxonomy);
    return TGRTAudioFileMetaDataReader::initWithTaxonomy(taxonomy);
}

}  // namespace

std::shared_ptr<TGRTFileNode> TGRTFileNode::nodeWithFileURL(const URL& url) {
    return std::shared_ptr<TGRTFileNode>(new TGRTFileNode(url));
}

std::shared_ptr<const TGRTContentNodeTypeValidator> TGRTFileNode::validatorForFileURL(const URL& url) {
    using Pointer = std::shared_ptr<const TGRTContentNodeTypeValidator>;
    static const std::array<Pointer, 6> validators = {
        std::make_shared<TGRTPatchTypeValidator>(),     std::make_shared<TGRTOstraProjectTypeValidator>(),
        std::make_shared<TGRTCstSxvPstTypeValidator>(), std::make_shared<TGRTVorthalPresetTypeValidator>(),
        std::make_shared<TGRTTavioLoopTypeValidator>(), std::make_shared<TGRTAudioFileTypeValidator>()};
    const auto hit = std::find_if(validators.begin(), validators.end(), [&url](const Pointer& validator) {
        return validator->isValidContentTypeAtFileURL(url);
    });
    return hit == validators.end() ? nullptr : *hit;
}

std::shared_ptr<TGRTMetaData> TGRTFileNode::readMetaDataWithOptions(std::uint64_t options,
                                                                    Error* error) const {
    return readMetaDataWithOptions(options, TGRTTaxonomy::mutableDefaultTaxonomy(), error);
}

std::shared_ptr<TGRTMetaData> TGRTFileNode::readMetaDataWithOptions(
    std::uint64_t options, const std::shared_ptr<TGRTTaxonomy>& taxonomy, Error* error) const {
    ItemFile file(url_);
    return readMetaDataOfFile(file, options, taxonomy, error);
}

std::shared_ptr<TGRTMetaData> TGRTFileNode::readMetaDataOfFile(ItemFile& file, std::uint64_t options,
                                                               const std::shared_ptr<TGRTTaxonomy>& taxonomy,
                                                               Error* error) {
    const URL& url = file.url();
    if (!taxonomy) {
        fail(error, kErrorInvalidArgument, "no taxonomy to read it with", {url.path()});
        return nullptr;
    }
    auto reader = TGRTMetaDataReaderFactory::metaDataReaderForURL(url, taxonomy);
    if (!reader) reader = readerForAudio(file, taxonomy);
    if (reader) return reader->readMetaDataFromFile(file, options, error);
    fail(error, kErrorNoContent, "no kind of content", {url.path()});
    return nullptr;
}

URL TGRTFileNode::recordURL() const {
    const auto kind = std::dynamic_pointer_cast<const BaseTypeValidator>(validator());
    const auto reader = kind ? kind->readerForFileURL(url_) : nullptr;
    return reader ? reader->recordURLForURL(url_) : url_;
}

unsigned TGRTFileNode::itemActions() const {
    const auto kind = validator();
    return kind ? kind->itemActionsForFileURL(url_) : 0;
}

std::optional<URL> TGRTFileNode::prelistenURL() const {
    const auto kind = validator();
    return kind ? kind->prelistenURLForFileURL(url_) : std::nullopt;
}

std::shared_ptr<TGRTMetaDataReader> TGRTFileNode::metaDataReaderForFileURL(const URL& url) const {
    const auto kind = validatorForFileURL(url);
    return kind ? kind->metaDataReaderForFileURL(url) : nullptr;
}

std::shared_ptr<TGRTTaggingsReader> TGRTFileNode::taggingReaderForFileURL(const URL& url) const {
    const auto kind = validatorForFileURL(url);
    return kind ? kind->taggingReaderForFileURL(url) : nullptr;
}

std::shared_ptr<TGRTTaggingsWriter> TGRTFileNode::taggingWriterForFileURL(const URL& url) const {
    const auto kind = validatorForFileURL(url);
    return kind ? kind->taggingWriterForFileURL(url) : nullptr;
}

std::shared_ptr<TGRTContentInfoWriter> TGRTFileNode::contentInfoWriterForFileURL(const URL& url) const {
    const auto kind = validatorForFileURL(url);
    return kind ? kind->contentInfoWriterForFileURL(url) : nullptr;
}

std::shared_ptr<TGRTMetaDataWriter> TGRTFileNode::metaDataWriterForFileURL(const URL& url) const {
    const auto kind = validatorForFileURL(url);
    return kind ? kind->metaDataWriterForFileURL(url) : nullptr;
}

bool TGRTFileNode::isEqual(const Object& other) const {
    const auto* node = dynamic_cast<const TGRTFileNode*>(&other);
    return node != nullptr && node->url_ == url_;
}

std::string TGRTFileNode::description() const {
    return fmt::format("<TGRTFileNode {}> {}", static_cast<const void*>(this), url_.absoluteString());
}

}  // namespace qvct
