#pragma once

#include "autotagging/LocationPath.h"
#include "platform/Error.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct _xmlNode;           // NOLINT(bugprone-reserved-identifier): libxml2's name
struct _xmlXPathCompExpr;  // NOLINT(bugprone-reserved-identifier): libxml2's name
struct _xmlXPathContext;   // NOLINT(bugprone-reserved-identifier): libxml2's name

namespace qvct {

/// Longest expression in bytes, and most steps of one evaluation (less than a second's worth).
inline constexpr std::size_t kLongestXPath = std::size_t{64} << 10;
inline constexpr unsigned long kMostXPathOperations = 20'000'000;

/// The place where one document's expressions are evaluated: no name spaces, no context node, a limit on the
/// work, messages to the log.
struct XPathContextCloser {
    void operator()(_xmlXPathContext* context) const;
};
using XPathContext = std::unique_ptr<_xmlXPathContext, XPathContextCloser>;
XPathContext makeXPathContext(_xmlDoc* document);

/// A compiled XPath 1.0 expression. Evaluating changes its caches: use one from one thread at a time.
class XPathExpression {
  public:
    /// Nothing and an error with the character where the expression goes wrong.
    static std::shared_ptr<const XPathExpression> compile(std::string_view text, Error* error = nullptr);

    /// The same from this thread's cache, so that a rule is compiled once, and a wrong one told once: by the
    /// error, or by the log where none is asked for.
    static std::shared_ptr<const XPathExpression> cached(std::string_view text, Error* error = nullptr);

    /// The selected nodes in document order; empty when the result is no node set or the limit was reached.
    std::vector<_xmlNode*> nodes(_xmlXPathContext& context) const;

    /// The first of `nodes`, or null. Common forms stop there (`LocationPath`), others select all.
    _xmlNode* firstNode(_xmlXPathContext& context) const;

    /// Whether `firstNode` walks the tree itself (in documents without entity declarations).
    bool isLocationPath() const { return locationPath_.has_value(); }

  private:
    struct Closer {
        void operator()(_xmlXPathCompExpr* expression) const;
    };

    std::string text_;
    std::unique_ptr<_xmlXPathCompExpr, Closer> compiled_;
    std::optional<LocationPath> locationPath_;
};

}  // namespace qvct
