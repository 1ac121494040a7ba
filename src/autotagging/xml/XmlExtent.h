#pragma once

#include "platform/data/xml/XmlLibrary.h"

#include <cstddef>

namespace qvct {

/// How much there is in a document for expressions to look at. Texts are counted in bytes with their entities
/// replaced, so that an entity counts once for each reference to it.
struct XmlExtent {
    std::size_t nodes = 0;         ///< Elements, attributes, texts and the like.
    std::size_t ids = 0;           ///< Attributes that identify their element.
    std::size_t text = 0;          ///< Of the whole document, without attributes.
    std::size_t elementTexts = 0;  ///< Of all elements together: a text counts once for each that it is in.
    std::size_t longestAttribute = 0;
    std::size_t attributeTexts = 0;  ///< Of all attributes together.
};

/// @cost  O(nodes)
XmlExtent extentOf(const _xmlDoc& document);

}  // namespace qvct
