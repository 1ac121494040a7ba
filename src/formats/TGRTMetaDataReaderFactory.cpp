#include "formats/TGRTMetaDataReaderFactory.h"

#include "formats/audiofile/TGRTTavioLoopMetaDataReader.h"
#include "formats/bundle/TGRTBundleMetaDataReader.h"
#include "formats/bundle/TGRTPatchMetaDataReader.h"
#include "formats/preset/TGRTVorthalPresetMetaDataReader.h"
#include "formats/settings/TGRTBinaryFileMetaDataReader.h"
#include "formats/settings/TGRTCstSxvPstMetaDataReader.h"

#include <array>

namespace qvct {
namespace {

template <typename Reader>
std::shared_ptr<TGRTBaseMetaDataReader> readerIfSupported(const std::string& extension,
                                                          const std::shared_ptr<TGRTTaxonomy>& taxonomy) {
    return Reader::supportsFileExtension(extension) ? Reader::initWithTaxonomy(taxonomy) : nullptr;
}

}  // namespace

std::shared_ptr<TGRTBaseMetaDataReader> TGRTMetaDataReaderFactory::metaDataReaderForURL(
    const URL& url, const std::shared_ptr<TGRTTaxonomy>& taxonomy) {
    constexpr std::array candidates = {&readerIfSupported<TGRTPatchMetaDataReader>,
                                       &readerIfSupported<TGRTVorthalPresetMetaDataReader>,
                                       &readerIfSupported<TGRTCstSxvPstMetaDataReader>,
                                       &readerIfSupported<TGRTTavioLoopMetaDataReader>,
                                       &readerIfSupported<TGRTOstraProjectMetaDataReader>,
                                       &readerIfSupported<TGRTBinaryFileMetaDataReader>};
    if (!taxonomy) return nullptr;
    const std::string extension = url.pathExtension();
    for (const auto candidate : candidates) {
        if (auto reader = candidate(extension, taxonomy)) return reader;
    }
    return nullptr;
}

std::shared_ptr<TGRTBaseMetaDataReader> TGRTMetaDataReaderFactory::metaDataReaderForURL(const URL& url) {
    return metaDataReaderForURL(url, TGRTTaxonomy::mutableDefaultTaxonomy());
}

}  // namespace qvct
