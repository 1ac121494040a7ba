#pragma once

#include <cstddef>
#include <string_view>

namespace qvct {

/// What makes an expression cost more than the nodes that it visits. The XML library counts these alone.
struct XPathCost {
    /// Node sets are merged, compared with each other, or sorted: for each node visited, all of the
    /// document's may be looked at.
    bool isJoin = false;
    /// The texts of elements are made: for each node visited, all of the document's text may be copied.
    bool readsText = false;
    /// Elements are looked up by texts that hold identifiers: each finding is compared with all others.
    bool readsIds = false;
    /// How many texts of nodes functions take, which may be held at once, or joined into one.
    std::size_t texts = 0;
};

/// Looks at the form of a well-formed expression. What is in doubt counts.
/// @cost  O(bytes)
XPathCost costOfXPath(std::string_view expression);

}  // namespace qvct
