#pragma once

#include "formats/TGRTContentNodeTypeValidator.h"
#include "metadata/TGRTMetaData.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTaggingCollection.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

namespace qvct {

class ItemFile;

/// One file or bundle, seen as content: its validator, and through it its reader and writers.
///
/// Nodes with equal URLs are equal. Immutable. Each call looks at the disk; nothing is remembered.
class QVCT_API TGRTFileNode : public Object, public FileURLNode {
  public:
    /// A node for the URL, whether anything lies there or not. Never null.
    static std::shared_ptr<TGRTFileNode> nodeWithFileURL(const URL& url);

    URL fileURL() const override { return url_; }

    /// The shared validator of the kind of content that lies at a URL; null when no validator accepts it.
    /// Kinds that have an extension of their own are asked first, then loops, then any audio file whatever
    /// its name.
    static std::shared_ptr<const TGRTContentNodeTypeValidator> validatorForFileURL(const URL& url);
    std::shared_ptr<const TGRTContentNodeTypeValidator> validator() const {
        return validatorForFileURL(url_);
    }

    /// The item's record, by the reader for its extension, or for its contents where the extension says
    /// nothing. Null, and an error if something is wrong, when there is none. Labels are resolved in the
    /// shared writable default taxonomy.
    std::shared_ptr<TGRTMetaData> readMetaDataWithOptions(std::uint64_t options,
                                                          Error* error = nullptr) const;
    /// The same with labels resolved in a taxonomy of the caller's. Null, and an error, without one.
    std::shared_ptr<TGRTMetaData> readMetaDataWithOptions(std::uint64_t options,
                                                          const std::shared_ptr<TGRTTaxonomy>& taxonomy,
                                                          Error* error = nullptr) const;
    /// The same for a file that may be open already.
    static std::shared_ptr<TGRTMetaData> readMetaDataOfFile(ItemFile& file, std::uint64_t options,
                                                            const std::shared_ptr<TGRTTaxonomy>& taxonomy,
                                                            Error* error = nullptr);

    /// The file that holds the item's record, whether it is there or not: the property list of a bundle or
    /// beside settings, else the item. Its `FileStamp` tells whether a record is still the one that was read.
    URL recordURL() const;

    /// ItemActions of this node.
    unsigned itemActions() const;
    std::optional<URL> prelistenURL() const;

    /// @{
    /// What the validator of a URL answers; null where there is none.
    std::shared_ptr<TGRTMetaDataReader> metaDataReaderForFileURL(const URL& url) const;
    std::shared_ptr<TGRTTaggingsReader> taggingReaderForFileURL(const URL& url) const;
    std::shared_ptr<TGRTTaggingsWriter> taggingWriterForFileURL(const URL& url) const;
    std::shared_ptr<TGRTContentInfoWriter> contentInfoWriterForFileURL(const URL& url) const;
    std::shared_ptr<TGRTMetaDataWriter> metaDataWriterForFileURL(const URL& url) const;
    /// @}

    bool isEqual(const Object& other) const override;
    std::size_t hash() const override { return stringHash(url_.absoluteString()); }
    std::string description() const override;

  private:
    explicit TGRTFileNode(URL url) : url_(std::move(url)) {}

    URL url_;
};

}  // namespace qvct
