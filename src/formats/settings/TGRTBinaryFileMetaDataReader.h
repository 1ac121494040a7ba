#pragma once

#include "formats/TGRTBaseMetaDataReader.h"
#include "platform/data/PropertyList.h"

#include <memory>
#include <optional>
#include <string_view>
#include <utility>

namespace qvct {

/// Reads the record of a data file, which carries it as a binary property list somewhere among its bytes.
///
/// A file that carries none is logged, unless the process has the argument "-XCTest", and yields a record
/// with file type 0. Files over kLargestWholeFile count as carrying none.
class TGRTBinaryFileMetaDataReader : public TGRTBaseMetaDataReader {
  public:
    static std::shared_ptr<TGRTBinaryFileMetaDataReader> initWithTaxonomy(
        std::shared_ptr<TGRTTaxonomy> taxonomy) {
        return std::shared_ptr<TGRTBinaryFileMetaDataReader>(
            new TGRTBinaryFileMetaDataReader(std::move(taxonomy)));
    }
    static bool supportsFileExtension(std::string_view extension);

    /// Never null. The error is set when nothing could be extracted.
    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;
    std::shared_ptr<TGRTMetaData> readMetaDataFromFile(ItemFile& file, std::uint64_t options,
                                                       Error* error = nullptr) const override;
    /// The dictionary from the first "bplist00" to the first trailer behind it.
    std::optional<PropertyList::Dictionary> _extractDictionaryFromURL(const URL& url,
                                                                      Error* error = nullptr) const;
    std::optional<PropertyList::Dictionary> _extractDictionaryFromFile(ItemFile& file,
                                                                       Error* error = nullptr) const;

  protected:
    using TGRTBaseMetaDataReader::TGRTBaseMetaDataReader;
};

/// Where a property list lies in a data file.
struct EmbeddedPropertyList {
    std::uint64_t offset = 0;
    std::uint64_t length = 0;
    PropertyList value;
};

/// Finds and parses the property list inside the bytes. Nothing, and an error with the byte offset where
/// known, when there is none.
/// @cost  O(size)
std::optional<EmbeddedPropertyList> findEmbeddedPropertyList(std::span<const std::uint8_t> bytes,
                                                             Error* error = nullptr);

}  // namespace qvct
