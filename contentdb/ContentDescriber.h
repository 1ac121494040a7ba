#pragma once

#include "autotagging/services/TaggingServiceNames.h"
#include "contentdb/IndexedItem.h"
#include "platform/base/Export.h"

#include <cstdint>
#include <memory>

namespace qvct::contentdb {

/// Describes content items as the framework sees them: the indexable object of the record, with taggings from
/// the record, taggings that follow from it, and those that tagging services derive.
///
/// A tagging that several of them have (the same label, category and level) is listed once, with the first of
/// these origins; services come in the order of `kTaggingServiceNames`. What services say together is what
/// the aggregator says. Labels that the taxonomy does not know are kept where the record has them.
///
/// Values are those of the record, without the numbers that stand for an unknown one; "Tempo" and
/// "BeatCount" also come from chunks of other makers, and the tempo at last from a name as "Beat 122bpm".
///
/// An item has failed when its record, or an audio file's header, cannot be read. One without record is
/// described by its name and the services.
class QVCT_API ContentDescriber : public ItemDescriber {
  public:
    /// `services`: a sum of QVCTAutoTaggingOptions.
    explicit ContentDescriber(std::uint64_t services = optionsForAllTaggingServices());
    ~ContentDescriber() override;

    /// A number that changes with what descriptions depend on besides the item: the services, the files that
    /// replace resources, the version of the library. For `IndexOptions::describer`.
    /// @cost  Reads the files that replace resources.
    static std::uint64_t digest(std::uint64_t services);

    std::optional<IndexedItem> describe(const std::string& path, Error* error) override;

  private:
    struct Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct::contentdb
