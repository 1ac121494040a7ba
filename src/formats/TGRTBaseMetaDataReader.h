#pragma once

#include "formats/TGRTMetaDataReader.h"
#include "platform/base/Export.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <span>
#include <string_view>
#include <utility>

namespace qvct {

class ItemFile;

/// Base of all readers. It reads nothing itself.
///
/// Readers are immutable: several threads may use one, as far as its taxonomy allows. Reading adds a file's
/// unknown labels to a writable taxonomy.
class QVCT_API TGRTBaseMetaDataReader : public TGRTMetaDataReader, public TGRTTaggingsReader {
  public:
    /// Null without a taxonomy.
    static std::shared_ptr<TGRTBaseMetaDataReader> initWithTaxonomy(std::shared_ptr<TGRTTaxonomy> taxonomy) {
        if (!taxonomy) return nullptr;
        return std::shared_ptr<TGRTBaseMetaDataReader>(new TGRTBaseMetaDataReader(std::move(taxonomy)));
    }

    /// The file that holds the record of the item at a URL: the item, unless its kind keeps it elsewhere.
    virtual URL recordURLForURL(const URL& url) const { return url; }

    /// The taxonomy in which labels are resolved.
    const std::shared_ptr<TGRTTaxonomy>& taxonomy() const { return taxonomy_; }

    std::shared_ptr<TGRTMetaData> readMetaDataFromURL(const URL& url, std::uint64_t options,
                                                      Error* error = nullptr) const override;
    /// The same for a file that may be open already. A kind whose record lies in the item's own file is read
    /// through it; others are read by their URL.
    virtual std::shared_ptr<TGRTMetaData> readMetaDataFromFile(ItemFile& file, std::uint64_t options,
                                                               Error* error = nullptr) const;
    bool readUUID(std::string* uuid, std::int64_t* fileType, ObjectSet<TGRTTagging>* taggings,
                  ObjectSet<TGRTKeyValue>* keyValues, std::uint64_t options, const URL& url) const override;
    ObjectSet<TGRTTagging> taggingsForFileURL(const URL& url) const override;
    ObjectSet<TGRTTagging> taggingsForFileURL(const URL& url, std::uint64_t options) const override;

  protected:
    /// The taxonomy is not null.
    explicit TGRTBaseMetaDataReader(std::shared_ptr<TGRTTaxonomy> taxonomy)
        : taxonomy_(std::move(taxonomy)) {}

    /// Whether the extension, put into lower case, is one of those given.
    static bool isExtensionIn(std::string_view extension, std::span<const std::string_view> lowercased);

  private:
    std::shared_ptr<TGRTTaxonomy> taxonomy_;
};

}  // namespace qvct
