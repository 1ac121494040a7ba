#pragma once

#include "autotagging/xml/LocationPath.h"
#include "autotagging/xml/XPathCost.h"
#include "autotagging/xml/XmlExtent.h"
#include "platform/base/Error.h"
#include "platform/data/xml/XmlLibrary.h"

#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Longest expression in bytes, and most steps of one evaluation (less than a second's worth).
inline constexpr std::size_t kLongestXPath = std::size_t{64} << 10;
inline constexpr unsigned long kMostXPathSteps = 20'000'000;
/// Bounds the work that the count of steps does not include: nodes compared or merged, and bytes of text
/// copied. An expression that may cause such work is allowed fewer steps, the fewer the larger the document
/// is. About a second's worth.
inline constexpr unsigned long kMostXPathWork = 2'000'000'000;
/// Most text that an evaluation may hold at once.
inline constexpr std::size_t kMostXPathText = std::size_t{16} << 20;

/// The context in which expressions are evaluated over one document: without name spaces or a context node,
/// with limits on the work; messages go to the log.
class XPathScope {
  public:
    explicit XPathScope(_xmlDoc& document);

    /// Whether the last evaluation came to its end. If not, one with more steps may find more.
    bool isComplete() const { return isComplete_; }

  private:
    friend class XPathExpression;
    const XmlExtent& extent();
    bool holdsTooMuchText(const XPathCost& cost);
    std::size_t workOfStep(const XPathCost& cost);

    XmlOwned<_xmlXPathContext> context_;
    bool isComplete_ = true;
    std::optional<XmlExtent> extent_;  // computed when an expression first needs it
};

/// A compiled XPath 1.0 expression. Evaluating changes its caches: use one from one thread at a time.
class XPathExpression {
  public:
    /// Nothing and an error with the character where the expression goes wrong.
    static std::shared_ptr<const XPathExpression> compile(std::string_view text, Error* error = nullptr);

    /// The same from this thread's cache, so that a rule is compiled once and a wrong one is reported once:
    /// through the error, or in the log where the caller asks for no error.
    static std::shared_ptr<const XPathExpression> cached(std::string_view text, Error* error = nullptr);

    /// The selected nodes in document order; empty when the result is no node set, or when a limit was
    /// reached, which the log tells. An XPathDeadline of the thread is such a limit.
    std::vector<_xmlNode*> nodes(XPathScope& scope) const;

    /// The first of `nodes`, or null. Common forms stop there (`LocationPath`), others select all.
    _xmlNode* firstNode(XPathScope& scope) const;

    /// Whether `firstNode` walks the tree itself (in documents without entity declarations).
    bool isLocationPath() const { return locationPath_.has_value(); }

  private:
    std::string text_;
    XmlOwned<_xmlXPathCompExpr> compiled_;
    std::optional<LocationPath> locationPath_;
    XPathCost cost_;
};

}  // namespace qvct
