#pragma once

#include "autotagging/services/TaggingServiceNames.h"
#include "contentdb/IndexedItem.h"
#include "platform/base/Export.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qvct::contentdb {

/// Describes content items as the framework sees them: the indexable object of the record, with taggings from
/// the record, taggings that follow from it, and those that tagging services derive.
///
/// A tagging that has several of these origins (the same label, category and level) is listed once, with the
/// first of them. With naming habits among the services (QVCTAutoTaggingOptionNames) it is decided as
/// `ItemTagger` does which of their tags hold; without them all do, the services in the order of
/// `kTaggingServiceNames`, as the aggregator gives them. Labels that the taxonomy does not know are kept if
/// they come from the record. Where it is decided, what a person rejected is left out, also of what services
/// stored and of what follows from the record.
///
/// Values are those of the record, without numbers that mean "unknown". "Tempo" and "BeatCount" may also come
/// from chunks of other makers, and failing that the tempo from a name such as "Beat 122bpm".
///
/// An item has failed when its record, or an audio file's header, cannot be read. One without record is
/// described by its name and the services.
class QVCT_API ContentDescriber : public ItemDescriber {
  public:
    /// `services`: a sum of QVCTAutoTaggingOptions. `folders`: those that are indexed; nothing above them
    /// says what an item is.
    explicit ContentDescriber(std::uint64_t services = optionsForAllTaggingServices(),
                              const std::vector<std::string>& folders = {});
    ~ContentDescriber() override;

    /// A number for `IndexOptions::describer` that changes with whatever descriptions depend on besides the
    /// item: the services, the files that replace resources, the version of the library.
    /// @cost  Reads the files that replace resources.
    static std::uint64_t digest(std::uint64_t services);

    std::optional<IndexedItem> describe(const std::string& path, Error* error) override;

  private:
    struct Implementation;
    std::unique_ptr<Implementation> implementation_;
};

}  // namespace qvct::contentdb
