#pragma once

#include <cstddef>
#include <string>

#include <libxml/xpath.h>

namespace qvct {

/// What the library's callbacks know of an evaluation, through the context's `userData`.
struct XPathEvaluation {
    const std::string& expression;
    std::size_t workOfStep = 1;
};

/// Replacements for those XPath functions that the XML library computes a byte at a time, or in a time that
/// grows with the product of their arguments' lengths. They give the same results in linear time, and count
/// as more than one step where they do more work than one. Null for all other names.
xmlXPathFunction linearXPathFunction(void* /*unused*/, const xmlChar* name, const xmlChar* nameSpace);

}  // namespace qvct
