#pragma once

#include <cstddef>
#include <string_view>

namespace qvct {

/// The first line of a table that maps the tags of a retired vocabulary to those of today. Fields are
/// separated by ";", without quoting.
inline constexpr std::string_view kLegacyMappingHeader =
    "Type;Legacy Keyword;Legacy Keyword Sub;New Taxonomy Keyword 1;New Taxonomy Keyword 2;"
    "New Taxonomy Keyword 3;New Taxonomy Keyword 4;Comments, Questions";

/// The place of each field in a row, and the number of fields.
enum LegacyMappingField : std::size_t {
    kLegacyMappingType = 0,
    kLegacyMappingKeyword = 1,
    kLegacyMappingSubKeyword = 2,
    kLegacyMappingFirstNew = 3,
    kLegacyMappingLastNew = 6,
    kLegacyMappingFieldCount = 8
};

}  // namespace qvct
