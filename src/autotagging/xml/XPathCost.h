#pragma once

#include <cstddef>
#include <string_view>

namespace qvct {

/// What makes an expression cost more than the nodes that it visits, which are all that the XML library
/// counts.
struct XPathCost {
    /// Node sets are merged, compared with each other, or sorted: for each node visited, all of the
    /// document's nodes may be looked at.
    bool isJoin = false;
    /// The texts of elements are put together: for each node visited, all of the document's text may be
    /// copied.
    bool readsText = false;
    /// Elements are looked up by identifiers in texts: each element found is compared with all others.
    bool readsIds = false;
    /// How many texts of nodes are passed to functions; all of them may be held at once, or joined into one.
    std::size_t texts = 0;
};

/// Looks at the form of a well-formed expression. In doubt, the higher cost is assumed.
/// @cost  O(bytes)
XPathCost costOfXPath(std::string_view expression);

}  // namespace qvct
