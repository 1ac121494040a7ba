#include "autotagging/QVCTXMLDocument.h"

#include "autotagging/QVCTXMLParser.h"
#include "autotagging/XPathExpression.h"
#include "platform/Decompression.h"
#include "platform/FileAccess.h"
#include "platform/Json.h"
#include "platform/Log.h"
#include "platform/Text.h"

#include <limits>
#include <unordered_map>
#include <utility>

#include <fmt/format.h>
#include <libxml/SAX2.h>
#include <libxml/parser.h>
#include <libxml/tree.h>

namespace qvct {
namespace {

/// Most JSON text that a document keeps for the next script, in bytes.
constexpr std::size_t kMostKeptJson = std::size_t{1} << 20;

/// Largest text that is turned into JSON for a script, which cannot be stopped in the middle of it.
constexpr std::size_t kLargestForJson = std::size_t{16} << 20;

/// Most elements and attributes of a document, whose tree takes up to a gigabyte then; large patches have
/// 10,000.
constexpr int kMostNodes = 1000000;

/// Most messages about one document; damaged ones may cause one for each line.
constexpr int kMostMessages = 5;

struct ParserCloser {
    void operator()(xmlParserCtxt* context) const { xmlFreeParserCtxt(context); }
};

struct DocumentCloser {
    void operator()(xmlDoc* document) const { xmlFreeDoc(document); }
};
using Document = std::unique_ptr<xmlDoc, DocumentCloser>;

/// Passes the XML library's messages to the log, and ends the parsing of what grows too large.
class ParserGuard {
  public:
    ParserGuard(xmlParserCtxt& parser, std::string_view name) : name_(printable(name)) {
        parser._private = this;
        parser.sax->serror = receive;
        parser.sax->startElementNs = startElement;
    }

    static void receive(void* context, xmlErrorPtr error) {
        auto& self = of(context);
        const std::string_view reason = error->message == nullptr ? "unknown fault" : error->message;
        if (++self.count_ > kMostMessages) return;
        log(fmt::format("{}, line {}: {}", self.name_, error->line, trimBlanksAndLineBreaks(reason)));
    }

    void logOmitted() const {
        if (count_ > kMostMessages) log(fmt::format("{}: {} more faults", name_, count_ - kMostMessages));
    }

  private:
    static ParserGuard& of(void* context) {
        return *static_cast<ParserGuard*>(static_cast<xmlParserCtxt*>(context)->_private);
    }

    static void startElement(void* context, const xmlChar* name, const xmlChar* prefix, const xmlChar* uri,
                             int nameSpaceCount, const xmlChar** nameSpaces, int attributeCount,
                             int defaultedCount, const xmlChar** attributes) {
        auto& self = of(context);
        self.nodes_ += 1 + attributeCount;
        if (self.nodes_ <= kMostNodes) {
            return xmlSAX2StartElementNs(context, name, prefix, uri, nameSpaceCount, nameSpaces,
                                         attributeCount, defaultedCount, attributes);
        }
        log(fmt::format("{}: more than {} elements and attributes; the rest is left out", self.name_,
                        kMostNodes));
        xmlStopParser(static_cast<xmlParserCtxt*>(context));
    }

    std::string name_;
    int count_ = 0;
    int nodes_ = 0;
};

/// Whether elements can be told to a parser as they stand in the tree: what was mended may have no text that
/// is well-formed, entities are replaced only in text, and longer texts may be too long for JSON.
bool isPlain(const xmlParserCtxt& parser, const xmlDoc& document, std::string_view text) {
    constexpr std::size_t longest = kLargestForJson / 8;  // a character becomes six bytes of text at most
    return parser.wellFormed != 0 && document.intSubset == nullptr && text.size() <= longest;
}

Document parse(std::string_view text, std::string_view name, bool& isPlainTree) {
    static const bool isInitialized = (xmlInitParser(), true);  // before several threads parse at once
    const std::unique_ptr<xmlParserCtxt, ParserCloser> context(isInitialized ? xmlNewParserCtxt() : nullptr);
    if (!context || text.size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) return nullptr;
    ParserGuard guard(*context, name);
    Document document(xmlCtxtReadMemory(context.get(), text.data(), static_cast<int>(text.size()), nullptr,
                                        nullptr, XML_PARSE_RECOVER | XML_PARSE_NONET));
    isPlainTree = document != nullptr && isPlain(*context, *document, text);
    guard.logOmitted();
    return document;
}

std::string_view textOf(const std::vector<std::uint8_t>& bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

}  // namespace

struct QVCTXMLDocument::Implementation {
    Document document;
    bool isPlain = false;
    XPathContext context;  // after the document, on which it depends
    /// By expression: the scripts of a rule set ask for the same plug-ins.
    std::unordered_map<std::string, std::optional<std::string>> keptJson;
    std::size_t keptBytes = 0;

    Implementation(std::string_view text, std::string_view name) {
        if (!text.empty()) document = parse(text, name, isPlain);
        if (document) context = makeXPathContext(document.get());
    }

    xmlNode* firstNode(std::string_view expression) const {
        if (!context || expression.empty()) return nullptr;
        const auto compiled = XPathExpression::cached(expression);
        return compiled ? compiled->firstNode(*context) : nullptr;
    }

    /// The JSON of the element's text, which is written and read only where that may make a difference.
    std::optional<std::string> jsonOf(xmlNode* node) const {
        if (!isPlain || node->type != XML_ELEMENT_NODE)
            return QVCTXMLDocument::JSONStringWithData(QVSKXMLNode::initWithXMLNode(node)->XMLData());
        QVCTXMLParser parser;
        parser.didFindElement(*node);
        return jsonText(PropertyList(parser.takeObject()), JsonStyle::pretty);
    }
};

QVCTXMLDocument::QVCTXMLDocument(std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}
QVCTXMLDocument::~QVCTXMLDocument() = default;

std::shared_ptr<QVCTXMLDocument> QVCTXMLDocument::initWithXMLData(std::string_view text,
                                                                  std::string_view name) {
    return std::shared_ptr<QVCTXMLDocument>(
        new QVCTXMLDocument(std::make_unique<Implementation>(text, name)));
}

std::shared_ptr<QVCTXMLDocument> QVCTXMLDocument::initWithContentsOfURL(const URL& url) {
    if (url.pathExtension() == "zxml") return initWithContentsOfQVZippedXMLURL(url);
    Error error;
    const auto bytes = readFile(url.path(), &error);
    if (!bytes) log(error.message);
    return initWithXMLData(bytes ? textOf(*bytes) : std::string_view{}, url.path());
}

std::shared_ptr<QVCTXMLDocument> QVCTXMLDocument::initWithContentsOfQVZippedXMLURL(const URL& url) {
    Error error;
    std::optional<std::vector<std::uint8_t>> xml;
    if (const auto bytes = readFile(url.path(), &error)) {
        xml = decompress(*bytes, &error);
        if (!xml) error.message = fmt::format("{}: {}", printable(url.path()), error.message);
    }
    if (!xml) log(error.message);
    return initWithXMLData(xml ? textOf(*xml) : std::string_view{}, url.path());
}

bool QVCTXMLDocument::hasContent() const {
    return implementation_->document != nullptr;
}

std::vector<std::shared_ptr<QVSKXMLNode>> QVCTXMLDocument::nodesForXPath(std::string_view expression) const {
    std::vector<std::shared_ptr<QVSKXMLNode>> nodes;
    if (!implementation_->context || expression.empty()) return nodes;
    const auto compiled = XPathExpression::cached(expression);
    if (!compiled) return nodes;
    for (xmlNode* node : compiled->nodes(*implementation_->context)) {
        nodes.push_back(QVSKXMLNode::initWithXMLNode(node));
    }
    return nodes;
}

std::shared_ptr<QVSKXMLNode> QVCTXMLDocument::firstNodeForXPath(std::string_view expression) const {
    return QVSKXMLNode::initWithXMLNode(implementation_->firstNode(expression));
}

bool QVCTXMLDocument::anyNodesForXPath(std::string_view expression) const {
    return implementation_->firstNode(expression) != nullptr;
}

bool QVCTXMLDocument::isMatchingXPath(std::string_view expression) const {
    return anyNodesForXPath(expression);
}

std::optional<std::string> QVCTXMLDocument::JSONStringForXPath(std::string_view expression) const {
    Implementation& self = *implementation_;
    std::string key(expression);
    if (const auto kept = self.keptJson.find(key); kept != self.keptJson.end()) return kept->second;
    xmlNode* node = self.firstNode(expression);
    std::optional<std::string> json = node != nullptr ? self.jsonOf(node) : std::nullopt;
    const std::size_t bytes = key.size() + (json ? json->size() : 0);
    if (self.keptBytes + bytes <= kMostKeptJson) {
        self.keptBytes += bytes;
        self.keptJson.emplace(std::move(key), json);
    }
    return json;
}

std::optional<std::string> QVCTXMLDocument::JSONString() const {
    xmlNode* root = hasContent() ? xmlDocGetRootElement(implementation_->document.get()) : nullptr;
    return implementation_->isPlain && root != nullptr ? implementation_->jsonOf(root)
                                                       : JSONStringWithData(XMLData());
}

std::string QVCTXMLDocument::XMLData() const {
    if (!hasContent()) return {};
    xmlChar* raw = nullptr;
    int size = 0;
    xmlDocDumpFormatMemory(implementation_->document.get(), &raw, &size, 0);
    const std::unique_ptr<xmlChar, decltype(xmlFree)> text(raw, xmlFree);
    return size > 0 ? std::string(reinterpret_cast<const char*>(raw), static_cast<std::size_t>(size))
                    : std::string{};
}

std::optional<std::string> QVCTXMLDocument::JSONStringWithData(std::string_view data) {
    if (data.empty()) return std::nullopt;
    if (data.size() > kLargestForJson) {
        log(fmt::format("JSON of {} bytes of XML is refused (at most {})", data.size(), kLargestForJson));
        return std::nullopt;
    }
    auto dictionary = QVCTXMLParser::dictionaryForXMLData(data);
    if (!dictionary) return std::nullopt;
    return jsonText(PropertyList(std::move(*dictionary)), JsonStyle::pretty);
}

}  // namespace qvct
