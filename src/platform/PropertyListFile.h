#pragma once

#include "platform/Error.h"
#include "platform/Export.h"
#include "platform/PropertyList.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

// Reading and writing property lists, XML and binary.
//
// What is read is bounded before anything is built from it: the nesting by kDeepestPropertyList, the values
// that a binary list's shared references expand to by its size. Everything that a property list can hold
// survives a read and a write in either encoding, in its order; dates lose fractions of a second in XML.

/// How deep a property list may nest; deeper ones are refused as too large.
inline constexpr int kDeepestPropertyList = 512;

/// The two encodings of a property list.
enum class PropertyListFormat { xml, binary };

/// @{
/// The value that the bytes hold in either encoding, or nothing and an error with the byte offset where
/// known.
/// @cost  O(size); memory at most proportional to the size.
QVCT_API std::optional<PropertyList> parsePropertyList(std::span<const std::uint8_t> bytes,
                                                       Error* error = nullptr);
QVCT_API std::optional<PropertyList> parsePropertyList(std::string_view bytes, Error* error = nullptr);
/// @}

/// XML with header, document type and tabs, or binary format 1.0. Empty on failure, which only texts bring
/// about that could not be read back: not UTF-8, with a NUL character or, in XML, with a character that XML
/// forbids.
QVCT_API std::string serializePropertyList(const PropertyList& value, PropertyListFormat format);

/// The value in a file; errors name the path.
QVCT_API std::optional<PropertyList> readPropertyListFile(const std::string& path, Error* error = nullptr);
/// The dictionary in a file; any other value is an error.
QVCT_API std::optional<PropertyList::Dictionary> readDictionaryFile(const std::string& path,
                                                                    Error* error = nullptr);
/// Writes as `replaceFile` does: the file holds the old or the new value at any instant.
QVCT_API bool writePropertyListFile(const PropertyList& value, const std::string& path,
                                    PropertyListFormat format, Error* error = nullptr);

}  // namespace qvct
