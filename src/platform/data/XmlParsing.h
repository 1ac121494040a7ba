#pragma once

#include "platform/base/Error.h"
#include "platform/data/XmlLibrary.h"

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Most attributes and name space declarations of one element, attributes that a document type declares, and
/// name spaces in scope: the XML library compares each of them with all the others.
inline constexpr int kMostXmlAttributes = 1000;
inline constexpr int kMostXmlNameSpaces = 256;
/// Most elements and attributes of a document, and the bytes of text that stand for one more: a tree takes a
/// hundred bytes and more for each. Large patches have 10,000, one for 20 bytes.
inline constexpr std::size_t kMostXmlNodes = 100'000;
inline constexpr std::size_t kXmlBytesOfNode = 40;

/// A parsed text, malformed XML being recovered up to where it makes sense.
struct ParsedXml {
    XmlOwned<_xmlDoc> tree;           ///< Null when there is nothing to recover, or too much.
    bool isWellFormed = false;        ///< Whether the tree is all of the text.
    std::vector<std::string> faults;  ///< The first few, each with its line.
    std::size_t moreFaults = 0;       ///< Those behind.
};

/// Parses without reading anything outside the text: no network, no external entities or document types. The
/// XML library's own bounds on depth, names and the growth of entities hold, and those above: an element with
/// too many attributes, or a declaration of such, ends the document before it.
/// @cost  O(bytes)
ParsedXml parseXml(std::string_view text);

/// Where an element has one attribute too many, counted without parsing. The text is UTF-8, or of another
/// encoding in which the bytes of markup occur in no other character.
/// @cost  O(bytes), a nanosecond each.
std::optional<std::size_t> attributeTooMany(std::string_view text);

/// Whether no element has too many attributes; else false, and an error with its line. Texts in UTF-8,
/// UTF-16, UTF-32 and encodings in which the bytes of markup occur in no other character are read; others are
/// refused, and so is a declaration too long to tell.
/// @cost  O(bytes), a nanosecond each.
bool hasFewAttributes(std::string_view text, Error* error = nullptr);

}  // namespace qvct
