#include "autotagging/xml/XPathExpression.h"

#include "autotagging/xml/XPathDeadline.h"
#include "autotagging/xml/XPathFunctions.h"
#include "autotagging/xml/XPathNames.h"
#include "platform/base/Log.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <string>
#include <unordered_map>

#include <fmt/format.h>
#include <libxml/xpath.h>
#include <libxml/xpathInternals.h>

namespace qvct {
namespace {

/// Most expressions that a thread keeps; scripts may make up new ones without end.
constexpr std::size_t kMostCachedExpressions = 1024;

/// The number of the first XPath fault among the library's error codes.
constexpr int kFirstReason = XML_XPATH_EXPRESSION_OK;

std::string_view reasonOf(int code) {
    switch (code) {
        case XML_XPATH_NUMBER_ERROR:
            return "malformed number";
        case XML_XPATH_UNFINISHED_LITERAL_ERROR:
            return "unfinished text";
        case XML_XPATH_START_LITERAL_ERROR:
            return "a text must begin here";
        case XML_XPATH_VARIABLE_REF_ERROR:
            return "malformed variable";
        case XML_XPATH_UNDEF_VARIABLE_ERROR:
            return "undefined variable";
        case XML_XPATH_INVALID_PREDICATE_ERROR:
            return "malformed predicate";
        case XML_XPATH_EXPR_ERROR:
            return "malformed expression";
        case XML_XPATH_UNCLOSED_ERROR:
            return "unclosed bracket";
        case XML_XPATH_UNKNOWN_FUNC_ERROR:
            return "unknown function";
        case XML_XPATH_INVALID_OPERAND:
            return "operand of the wrong type";
        case XML_XPATH_INVALID_TYPE:
            return "value of the wrong type";
        case XML_XPATH_INVALID_ARITY:
            return "wrong number of arguments";
        case XML_XPATH_UNDEF_PREFIX_ERROR:
            return "undefined prefix";
        case XML_XPATH_ENCODING_ERROR:
            return "not UTF-8";
        case XML_XPATH_INVALID_CHAR_ERROR:
            return "character that XML does not allow";
        case XML_XPATH_MEMORY_ERROR:
            return "out of memory";
        case kFirstReason + XPATH_OP_LIMIT_EXCEEDED:
            return "takes too many steps in this document";
        case kFirstReason + XPATH_RECURSION_LIMIT_EXCEEDED:
            return "nested too deep";
        default:
            return "cannot be evaluated";
    }
}

std::string shortened(std::string_view text) {
    constexpr std::size_t kLongest = 200;
    return printable(text.substr(0, kLongest)) + (text.size() > kLongest ? "..." : "");
}

/// The offset is in bytes, the error counts characters from 1.
Error syntaxError(std::string_view text, std::size_t offset, std::string_view reason) {
    const std::string_view before = text.substr(0, offset);
    const auto character =
        1 + std::count_if(before.begin(), before.end(), [](char c) { return (c & 0xC0) != 0x80; });
    return errorOf(kErrorMalformed, std::string(reason),
                   {.part = fmt::format("XPath \"{}\", character {}", shortened(text), character)});
}

void keepSyntaxError(void* target, xmlErrorPtr raised) {
    const std::string_view text = raised->str1 == nullptr ? std::string_view{} : raised->str1;
    const auto offset = static_cast<std::size_t>(std::max(raised->int1, 0));
    *static_cast<Error*>(target) = syntaxError(text, offset, reasonOf(raised->code));
}

void logProblem(const std::string& expression, std::string_view reason) {
    log(fmt::format("XPath \"{}\": {}", shortened(expression), reason));
}

void logEvaluationError(void* evaluation, xmlErrorPtr raised) {
    logProblem(static_cast<const XPathEvaluation*>(evaluation)->expression, reasonOf(raised->code));
}

}  // namespace

XPathScope::XPathScope(_xmlDoc& document) : context_(xmlXPathNewContext(&document)) {
    if (!context_) return;
    context_->error = logEvaluationError;
    xmlXPathRegisterFuncLookup(context_.get(), linearXPathFunction, nullptr);
}

const XmlExtent& XPathScope::extent() {
    if (extent_) return *extent_;
    xmlXPathOrderDocElems(context_->doc);  // makes comparing the order of two elements cheap
    return extent_.emplace(extentOf(*context_->doc));
}

bool XPathScope::holdsTooMuchText(const XPathCost& cost) {
    const XmlExtent& all = extent();
    const std::size_t longest = std::max(all.longestAttribute, cost.readsText ? all.text : 0);
    const std::size_t compared = cost.readsText ? all.elementTexts : 0;
    return longest > kMostXPathText / std::max<std::size_t>(cost.texts, 1) ||
           (cost.isJoin && (all.attributeTexts > kMostXPathText || compared > kMostXPathText));
}

std::size_t XPathScope::workOfStep(const XPathCost& cost) {
    constexpr std::size_t bytesOfWork = 8;  // so many are copied in the time of one comparison
    const XmlExtent& all = extent();
    std::size_t bytes = all.longestAttribute;
    if (cost.readsText) bytes += cost.isJoin ? all.elementTexts : all.text;
    const std::size_t nodes = cost.isJoin || cost.readsText ? all.nodes : 0;
    const std::size_t copied = bytes * std::max<std::size_t>(cost.texts, 1);
    const std::size_t lookedUp = cost.readsIds ? all.ids * copied : 0;
    return 1 + nodes + copied / bytesOfWork + lookedUp;
}

std::shared_ptr<const XPathExpression> XPathExpression::compile(std::string_view text, Error* error) {
    if (text.empty() || text.size() > kLongestXPath || text.find('\0') != std::string_view::npos) {
        fail(error, kErrorMalformed, "empty, too long or binary",
             {.part = fmt::format("XPath of {} bytes", text.size())});
        return nullptr;
    }
    prepareXmlLibrary();
    const XmlOwned<xmlXPathContext> context(xmlXPathNewContext(nullptr));
    if (!context) return nullptr;
    Error raised;
    context->error = keepSyntaxError;
    context->userData = &raised;
    auto expression = std::make_shared<XPathExpression>();
    expression->text_ = text;
    expression->compiled_.reset(xmlXPathCtxtCompile(context.get(), xmlText(expression->text_.c_str())));
    // The library reports these only when evaluation reaches them, in some documents and not in others.
    const auto unknown = expression->compiled_ ? unknownXPathName(text) : std::nullopt;
    if (unknown) raised = syntaxError(text, unknown->offset, unknown->reason);
    if (!expression->compiled_ || unknown) {
        if (error != nullptr) *error = std::move(raised);
        return nullptr;
    }
    expression->locationPath_ = LocationPath::parse(text);
    expression->cost_ = costOfXPath(text);
    return expression;
}

std::shared_ptr<const XPathExpression> XPathExpression::cached(std::string_view text, Error* error) {
    thread_local std::unordered_map<std::string, std::shared_ptr<const XPathExpression>> cache;
    std::string key(text);
    const auto hit = cache.find(key);
    if (hit != cache.end() && (hit->second || error == nullptr)) return hit->second;
    if (cache.size() >= kMostCachedExpressions) cache.clear();
    Error reason;
    std::shared_ptr<const XPathExpression> expression = compile(text, &reason);
    if (!expression && error != nullptr) {
        *error = std::move(reason);
    } else if (!expression) {
        log(reason.message());
    }
    return cache.emplace(std::move(key), std::move(expression)).first->second;
}

std::vector<xmlNode*> XPathExpression::nodes(XPathScope& scope) const {
    scope.isComplete_ = false;
    if (!scope.context_) return {};
    if (scope.holdsTooMuchText(cost_)) {
        logProblem(text_, "reads too much text in this document");
        return {};
    }
    xmlXPathContext& context = *scope.context_;
    const std::size_t workOfStep = scope.workOfStep(cost_);
    const auto mostSteps = static_cast<double>(std::min(kMostXPathSteps, kMostXPathWork / workOfStep));
    XPathEvaluation evaluation{text_, workOfStep};
    context.opLimit = 1 + static_cast<unsigned long>(XPathDeadline::shareOfSteps() * mostSteps);
    context.opCount = 0;
    context.node = nullptr;
    context.userData = &evaluation;
    const XmlOwned<xmlXPathObject> result(xmlXPathCompiledEval(compiled_.get(), &context));
    scope.isComplete_ = result != nullptr;
    if (!result || result->type != XPATH_NODESET || result->nodesetval == nullptr) return {};
    std::vector<xmlNode*> selected;
    for (int i = 0; i < result->nodesetval->nodeNr; ++i) {
        // Name space nodes are made for the result and would not outlive it.
        xmlNode* node = result->nodesetval->nodeTab[i];
        if (node->type != XML_NAMESPACE_DECL) selected.push_back(node);
    }
    return selected;
}

xmlNode* XPathExpression::firstNode(XPathScope& scope) const {
    if (!scope.context_) return nullptr;
    scope.isComplete_ = true;
    // The library compares texts that hold entity references in a way of its own.
    const xmlDoc* document = scope.context_->doc;
    const bool mayHoldReferences = document->intSubset != nullptr;
    if (locationPath_ && !mayHoldReferences) return locationPath_->firstNode(document);
    const std::vector<xmlNode*> all = nodes(scope);
    return all.empty() ? nullptr : all.front();
}

}  // namespace qvct
