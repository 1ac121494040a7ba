#pragma once

#include <cstddef>
#include <string>

#include <libxml/xpath.h>

namespace qvct {

/// What the library's callbacks find of an evaluation, in the context's `userData`.
struct XPathEvaluation {
    const std::string& expression;
    std::size_t workOfStep = 1;
};

/// XPath's functions that the XML library computes in time that grows with the product of their arguments'
/// lengths, or a byte at a time: the same results in linear time. What is more work than a step's counts as
/// more steps. Null for all other names.
xmlXPathFunction linearXPathFunction(void* /*unused*/, const xmlChar* name, const xmlChar* nameSpace);

}  // namespace qvct
