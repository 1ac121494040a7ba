#pragma once

#include "formats/TGRTBaseMetaDataReader.h"

#include <memory>
#include <string_view>
#include <utility>

namespace qvct {

/// Reads the record in the text of a synth preset (docs/formats/synth-preset.md), and on demand the tags that
/// older versions wrote into it as codes. Its file type is always kFileTypeSynthPreset.
class TGRTVorthalPresetMetaDataReader : public TGRTBaseMetaDataReader {
  public:
    static std::shared_ptr<TGRTVorthalPresetMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTVorthalPresetMetaDataReader>(
            new TGRTVorthalPresetMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);

    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;
    std::shared_ptr<TGRTMetaData> readMetaDataFromFile(ItemFile& file, std::uint64_t options,
                                                       Error* error = nullptr) const override;
    std::int64_t defaultFileType() const override { return kFileTypeSynthPreset; }

  protected:
    using TGRTBaseMetaDataReader::TGRTBaseMetaDataReader;
};

}  // namespace qvct
