#pragma once

#include "formats/ItemFile.h"
#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <cstdint>
#include <memory>
#include <optional>

namespace qvct {

class QVCTXMLDocument;
class TGRTMetaData;

/// A content item as it is prepared for tagging, listing and indexing: its XML description, its record and
/// what its chunks say, each read on first use, once.
///
/// Code that asks several things about an item hands one of these around, so that its files are opened once.
/// It shows the item as it was when it was read. Not thread-safe.
class QVCT_API ContentItem {
  public:
    /// What is to be read, and how.
    struct Reading {
        std::uint64_t options = 0;               ///< For the record: MetaDataReaderOptions.
        std::shared_ptr<TGRTTaxonomy> taxonomy;  ///< For its labels; null is the shared writable default one.
        bool withXmlDocument = true;             ///< If false, `xmlDocument` is null.
    };

    /// With the stored record alone, its labels resolved in the shared writable default taxonomy.
    explicit ContentItem(URL url);
    /// With a record that is read in another way.
    ContentItem(URL url, Reading reading);
    ~ContentItem();

    const URL& url() const { return file_.url(); }
    /// The item's own file; a bundle has none.
    ItemFile& file() { return file_; }

    /// The file of the XML description in or beside the item; null without one.
    ItemFile* descriptionFile();
    /// The XML description; null without one.
    std::shared_ptr<QVCTXMLDocument> xmlDocument();
    /// The stored record, as `TGRTFileNode::readMetaDataWithOptions` answers it: null without one, and with
    /// an error when it cannot be read.
    std::shared_ptr<TGRTMetaData> record(Error* error = nullptr);
    /// What the chunks of an audio file say; null for anything else.
    std::shared_ptr<LCFileData> fileData() { return file_.audio(); }

  private:
    struct Record {
        std::shared_ptr<TGRTMetaData> record;
        std::optional<Error> error;
    };

    ItemFile file_;
    Reading reading_;
    std::optional<std::unique_ptr<ItemFile>> descriptionFile_;
    std::optional<std::shared_ptr<QVCTXMLDocument>> xmlDocument_;
    std::optional<Record> record_;
};

}  // namespace qvct
