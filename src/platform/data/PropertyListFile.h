#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/data/PropertyList.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace qvct {

// Reading property lists, binary, XML and in the old text form, the latter two in UTF-8 or UTF-16; writing
// them, binary and XML.
//
// What is read is bounded before anything is built from it: the nesting by kDeepestPropertyList, the keys and
// values to 150,000 and one more for every 64 bytes, the texts and data that a binary list's shared
// references expand to by its size. Reading and writing keep everything that a property list can hold, and
// its order, in either encoding, with these exceptions: of a key that comes twice the last value counts,
// dates in XML lose fractions of a second, and what is not part of a value (comments, attributes, the
// encoding, the spelling of a number) is lost.

/// How deep dictionaries and arrays of a property list may be nested. Deeper ones are refused as too large,
/// when read and when written alike, so that what is written can be read.
inline constexpr int kDeepestPropertyList = 1024;

/// The two encodings in which property lists are written.
enum class PropertyListFormat { xml, binary };

/// What a list is read for. Bytes behind the root element of an XML list (other than blanks, zeros and
/// comments) are ignored when it is only read; they are an error when it is to be rewritten, since they would
/// be lost.
enum class PropertyListUse { reading, rewriting };

/// @{
/// The value that the bytes hold, whatever the form, or nothing and an error with the offset of the byte at
/// fault.
/// @cost  O(size), with O(n log n) for the n keys of one dictionary; memory at most proportional to the size,
///   plus 64 MiB.
QVCT_API std::optional<PropertyList> parsePropertyList(std::span<const std::uint8_t> bytes,
                                                       Error* error = nullptr,
                                                       PropertyListUse use = PropertyListUse::reading);
QVCT_API std::optional<PropertyList> parsePropertyList(std::string_view bytes, Error* error = nullptr,
                                                       PropertyListUse use = PropertyListUse::reading);
/// @}

/// XML with header, document type and tabs, or binary format 1.0. Empty, and an error, for what could not be
/// read back: nesting over kDeepestPropertyList; too many keys and values; a text that is not UTF-8, with a
/// NUL character or, in XML, with a character that XML forbids; a date outside the years 1 to 9999.
QVCT_API std::string serializePropertyList(const PropertyList& value, PropertyListFormat format,
                                           Error* error = nullptr);

/// The value in a file; errors name the path.
QVCT_API std::optional<PropertyList> readPropertyListFile(const std::string& path, Error* error = nullptr,
                                                          PropertyListUse use = PropertyListUse::reading);
/// The dictionary in a file; any other value is an error.
QVCT_API std::optional<PropertyList::Dictionary> readDictionaryFile(
    const std::string& path, Error* error = nullptr, PropertyListUse use = PropertyListUse::reading);
/// Writes as `replaceFile` does: the file holds the old or the new value at any instant.
QVCT_API bool writePropertyListFile(const PropertyList& value, const std::string& path,
                                    PropertyListFormat format, Error* error = nullptr);

}  // namespace qvct
