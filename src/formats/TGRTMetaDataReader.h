#pragma once

#include "metadata/TGRTKeyValue.h"
#include "metadata/TGRTMetaData.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/base/ObjectSet.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TaggingTypes.h"

#include <cstdint>
#include <memory>
#include <string>

namespace qvct {

/// What a reader is asked for beyond the stored record; a bit set. The tagging services' bits may be set too.
enum MetaDataReaderOptions : std::uint64_t {
    kReadLegacyTaggings = 1,  ///< Loops and presets: also the tags of the retired vocabulary, as such.
    kReadMappedTaggings = 2,  ///< Loops and presets: also what those have become in the default taxonomy.
    kReadUntaggedPatch = 256  ///< A patch that stores nothing yields an empty record.
};

/// Turns one kind of content file into a record.
class QVCT_API TGRTMetaDataReader {
  public:
    virtual ~TGRTMetaDataReader() = default;

    /// The record that the item stores; null when it stores none, and null with an error when it cannot be
    /// read.
    virtual std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                              Error* error = nullptr) const = 0;
    /// `readUUID:fileType:taggings:keyValues:options:forFileURL:`. Fills in each argument that is not null;
    /// without a record, with empty sets and kFileTypeNone. The UUID is never filled in. Returns whether
    /// there is a record with a file type.
    virtual bool readUUID(std::string* uuid, std::int64_t* fileType, ObjectSet<TGRTTagging>* taggings,
                          ObjectSet<TGRTKeyValue>* keyValues, std::uint64_t options,
                          const URL& url) const = 0;
    /// The file type of an item that stores none.
    virtual std::int64_t defaultFileType() const { return kFileTypeNone; }
};

/// Reads the taggings alone; none from what cannot be read.
class QVCT_API TGRTTaggingsReader {
  public:
    virtual ~TGRTTaggingsReader() = default;
    /// @{
    /// The stored taggings, and those that the options (MetaDataReaderOptions) ask for.
    virtual ObjectSet<TGRTTagging> taggingsForFileURL(const URL& url) const = 0;
    virtual ObjectSet<TGRTTagging> taggingsForFileURL(const URL& url, std::uint64_t options) const = 0;
    /// @}
};

}  // namespace qvct
