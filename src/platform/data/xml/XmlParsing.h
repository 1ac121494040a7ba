#pragma once

#include "platform/base/Error.h"
#include "platform/data/xml/XmlLibrary.h"

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Most attributes and name space declarations of one element, and most attributes that a document type
/// declares; then, most name spaces in scope. The XML library compares each of them with all the others.
inline constexpr int kMostXmlAttributes = 1000;
inline constexpr int kMostXmlNameSpaces = 256;
/// Most elements and attributes of a document; one more is allowed for every `kXmlBytesOfNode` bytes of text.
/// A tree takes a hundred bytes and more for each. Large patches have 10,000, one for every 20 bytes.
inline constexpr std::size_t kMostXmlNodes = 100'000;
inline constexpr std::size_t kXmlBytesOfNode = 40;

/// A parsed text. Malformed XML is used as far as it makes sense.
struct ParsedXml {
    XmlOwned<_xmlDoc> tree;      ///< Null when there is nothing to recover, or too much.
    bool isWellFormed = false;   ///< Whether the tree is all of the text.
    std::vector<Error> faults;   ///< The first few, each with its line.
    std::size_t moreFaults = 0;  ///< How many more there were.
};

/// Parses without reading anything outside the text: no network, no external entities or document types. The
/// XML library's own bounds on depth, names and the growth of entities apply, and those above: a text with an
/// element of too many attributes is not parsed at all; too many elements, name spaces or declared attributes
/// end the document at that place.
/// @cost  O(bytes)
ParsedXml parseXml(std::string_view text);

/// Where an element has one attribute too many, counted without parsing. The text is UTF-8, or of another
/// encoding in which the bytes of markup occur in no other character.
/// @cost  O(bytes), a nanosecond each.
std::optional<std::size_t> attributeTooMany(std::string_view text);

/// Whether no element has too many attributes; else false, and an error with its line. Texts in UTF-8,
/// UTF-16, UTF-32 and encodings in which the bytes of markup occur in no other character are read; others are
/// refused, and so is an XML declaration of over 1 KB.
/// @cost  O(bytes), a nanosecond each.
bool hasFewAttributes(std::string_view text, Error* error = nullptr);

}  // namespace qvct
