#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"

#include <array>
#include <cstdint>
#include <string_view>

namespace qvct {

/// What people call a tagging service, and the option that runs it.
struct TaggingServiceName {
    std::string_view name;
    std::uint64_t option;
};

/// Databases number them: further ones come last.
inline constexpr std::array<TaggingServiceName, 9> kTaggingServiceNames = {
    {{"keywords", QVCTAutoTaggingOptionFilenameKeywords},
     {"rules", QVCTAutoTaggingOptionXMLRules},
     {"rhythm", QVCTAutoTaggingOptionRhythm},
     {"content-type", QVCTAutoTaggingOptionContentType},
     {"instruments", QVCTAutoTaggingOptionSoftwareInstruments},
     {"user", QVCTAutoTaggingOptionUserGenerated},
     {"translate", QVCTAutoTaggingOptionTranslateTags},
     {"names", QVCTAutoTaggingOptionNames},
     {"sound", QVCTAutoTaggingOptionSound}}};

/// The options that run every service.
constexpr std::uint64_t optionsForAllTaggingServices() {
    std::uint64_t options = 0;
    for (const TaggingServiceName& service : kTaggingServiceNames) options |= service.option;
    return options;
}

}  // namespace qvct
