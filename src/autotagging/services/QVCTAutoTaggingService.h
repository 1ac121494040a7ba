#pragma once

#include "autotagging/evidence/TagClaim.h"
#include "autotagging/services/TagDictionary.h"
#include "platform/base/Export.h"
#include "platform/text/Url.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace qvct {

class ItemFile;
class LCFileData;
class QVCTXMLDocument;
class TGRTMetaData;

/// Which services run. The lower bits are left to the reading of the metadata record.
enum QVCTAutoTaggingOptions : std::uint64_t {
    QVCTAutoTaggingOptionContentType = 0x008,
    QVCTAutoTaggingOptionFilenameKeywords = 0x010,
    QVCTAutoTaggingOptionRhythm = 0x020,
    QVCTAutoTaggingOptionXMLRules = 0x040,
    QVCTAutoTaggingOptionSoftwareInstruments = 0x080,
    QVCTAutoTaggingOptionUserGenerated = 0x100,
    QVCTAutoTaggingOptionTranslateTags = 0x200,
    QVCTAutoTaggingOptionNames = 0x400,
    QVCTAutoTaggingOptionSound = 0x800
};

/// What the services are given of an item whose tags are to be explained.
struct TaggedItem {
    ItemFile& file;
    std::shared_ptr<QVCTXMLDocument> xmlDocument;  ///< Null where the item has none, like the next two.
    std::shared_ptr<TGRTMetaData> metaData;
    std::shared_ptr<LCFileData> fileData;
    /// Its name without extension, then its folder's, and so on up to the outermost that counts.
    std::span<const std::string_view> names;
};

/// One way of deriving tags. Each service is switched on by one bit of the options.
class QVCT_API QVCTAutoTaggingService {
  public:
    virtual ~QVCTAutoTaggingService() = default;

    /// The tags of an item; none when the option bit is clear or the service has nothing to say.
    /// Each input but the URL is null where the item has none.
    virtual TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                                   const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                                   const std::shared_ptr<TGRTMetaData>& metaData,
                                                   const std::shared_ptr<LCFileData>& fileData,
                                                   std::uint64_t options) = 0;
    /// The same for an item whose file may be open already. This is what the aggregator calls. It calls the
    /// operation above; a service that reads the item's file overrides it, so that no file is opened twice.
    virtual TagDictionarySet tagsWithContentsOfFile(ItemFile& file,
                                                    const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                                    const std::shared_ptr<TGRTMetaData>& metaData,
                                                    const std::shared_ptr<LCFileData>& fileData,
                                                    std::uint64_t options);
    /// The same with what speaks for each tag. By default all tags of the operation above, seen in the item.
    virtual std::vector<TagClaim> claims(const TaggedItem& item, std::uint64_t options);
    /// What people call it; see `kTaggingServiceNames`.
    virtual std::string_view name() const { return "host"; }

  protected:
    /// A tag as a claim of this service; nothing for a dictionary without label.
    std::optional<TagClaim> claimOf(const TagDictionary& tag) const;
};

}  // namespace qvct
