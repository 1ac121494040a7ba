#pragma once

#include "formats/TGRTBaseMetaDataReader.h"

#include <memory>
#include <string_view>
#include <utility>

namespace qvct {

/// Reads the record of a channel strip, sampler or plug-in settings file, which lies in a property list
/// beside it: that of "Bass.cst" in "Bass.cst.plist".
class TGRTCstSxvPstMetaDataReader : public TGRTBaseMetaDataReader {
  public:
    static std::shared_ptr<TGRTCstSxvPstMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTCstSxvPstMetaDataReader>(
            new TGRTCstSxvPstMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);
    /// Where the record of a settings file lies.
    static URL sideCarURLForURL(const URL& url) { return url.URLByAppendingPathExtension("plist"); }
    URL recordURLForURL(const URL& url) const override { return sideCarURLForURL(url); }

    /// A stored file type is kept, none becomes that of the extension.
    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;

  protected:
    using TGRTBaseMetaDataReader::TGRTBaseMetaDataReader;
};

}  // namespace qvct
