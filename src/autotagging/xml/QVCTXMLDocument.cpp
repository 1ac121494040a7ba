#include "autotagging/xml/QVCTXMLDocument.h"

#include "autotagging/xml/QVCTXMLParser.h"
#include "autotagging/xml/XPathExpression.h"
#include "formats/ItemFile.h"
#include "platform/base/Log.h"
#include "platform/base/bytes/BytesAsText.h"
#include "platform/data/Json.h"
#include "platform/data/xml/XmlParsing.h"
#include "platform/files/FileAccess.h"
#include "platform/files/reading/Decompression.h"

#include <unordered_map>
#include <utility>

#include <fmt/format.h>
#include <libxml/tree.h>

namespace qvct {
namespace {

/// Most JSON text that a document keeps for the next script, in bytes.
constexpr std::size_t kMostKeptJson = std::size_t{1} << 20;

/// Whether elements can be given to the JSON parser directly from the tree. Otherwise they are written as
/// text and parsed again: a repaired document's text may not be well-formed, entities are replaced only in
/// text, and the JSON of longer texts may grow too large.
bool isPlain(const ParsedXml& parsed, std::string_view text) {
    constexpr std::size_t longest = kLargestForJson / 8;  // a character becomes six bytes of text at most
    return parsed.isWellFormed && parsed.tree->intSubset == nullptr && text.size() <= longest;
}

ParsedXml parse(std::string_view text, std::string_view name) {
    ParsedXml parsed = parseXml(text);
    for (Error& fault : parsed.faults) {
        failIn(name, &fault);
        log(fault.message());
    }
    if (parsed.moreFaults > 0) {
        const std::string more = fmt::format("{} more faults", parsed.moreFaults);
        log(errorOf(kErrorMalformed, more, {std::string(name)}).message());
    }
    return parsed;
}

/// The document in a file; without content, and logged, when it cannot be read.
std::shared_ptr<QVCTXMLDocument> documentInFile(ItemFile& file, bool isCompressed) {
    const std::string& path = file.url().path();
    Error error;
    auto xml = file.bytes(kLargestWholeFile, &error);
    if (xml && isCompressed) {
        xml = decompress(*xml, &error);
        if (!xml) failIn(path, &error);
    }
    if (!xml) log(error.message());
    const std::vector<std::uint8_t> bytes = std::move(xml).value_or(std::vector<std::uint8_t>{});
    return QVCTXMLDocument::initWithXMLData(textOf(bytes), path);
}

}  // namespace

struct QVCTXMLDocument::Implementation {
    XmlOwned<xmlDoc> document;
    std::size_t textSize = 0;
    bool isPlain = false;
    mutable std::optional<XPathScope> scope;  // declared after the document, which it refers to
    /// By expression, since the scripts of a rule set ask for the same plug-ins.
    std::unordered_map<std::string, std::optional<std::string>> keptJson;
    std::size_t keptBytes = 0;

    Implementation(std::string_view text, std::string_view name) : textSize(text.size()) {
        if (text.empty()) return;
        ParsedXml parsed = parse(text, name);
        if (!parsed.tree) return;
        isPlain = qvct::isPlain(parsed, text);
        document = std::move(parsed.tree);
        scope.emplace(*document);
    }

    xmlNode* firstNode(std::string_view expression) const {
        if (!scope || expression.empty()) return nullptr;
        const auto compiled = XPathExpression::cached(expression);
        return compiled ? compiled->firstNode(*scope) : nullptr;
    }

    /// The JSON of an element. It is written as text and parsed again only where that may make a difference.
    std::optional<std::string> jsonOf(xmlNode* node) const {
        if (!isPlain || node->type != XML_ELEMENT_NODE)
            return QVCTXMLDocument::JSONStringWithData(QVSKXMLNode::initWithXMLNode(node)->XMLData());
        QVCTXMLParser parser(QVCTXMLParser::largestJson(textSize));
        parser.didFindElement(*node);
        if (parser.isTooLarge()) {
            log("JSON grows too large");
            return std::nullopt;
        }
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
    ItemFile file(url);
    return initWithContentsOfFile(file);
}

std::shared_ptr<QVCTXMLDocument> QVCTXMLDocument::initWithContentsOfFile(ItemFile& file) {
    return documentInFile(file, file.url().pathExtension() == "zxml");
}

std::shared_ptr<QVCTXMLDocument> QVCTXMLDocument::initWithContentsOfQVZippedXMLURL(const URL& url) {
    ItemFile file(url);
    return documentInFile(file, true);
}

bool QVCTXMLDocument::hasContent() const {
    return implementation_->document != nullptr;
}

std::vector<std::shared_ptr<QVSKXMLNode>> QVCTXMLDocument::nodesForXPath(std::string_view expression) const {
    std::vector<std::shared_ptr<QVSKXMLNode>> nodes;
    if (!implementation_->scope || expression.empty()) return nodes;
    const auto compiled = XPathExpression::cached(expression);
    if (!compiled) return nodes;
    for (xmlNode* node : compiled->nodes(*implementation_->scope)) {
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
    const bool isFinal = !self.scope || self.scope->isComplete();
    if (isFinal && self.keptBytes + bytes <= kMostKeptJson) {
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
    const XmlOwned<xmlChar> text(raw);
    return size > 0 ? std::string(reinterpret_cast<const char*>(raw), static_cast<std::size_t>(size))
                    : std::string{};
}

std::optional<std::string> QVCTXMLDocument::JSONStringWithData(std::string_view data) {
    if (data.empty()) return std::nullopt;
    if (data.size() > kLargestForJson) {
        log(fmt::format("JSON of {} bytes of XML is refused (at most {})", data.size(), kLargestForJson));
        return std::nullopt;
    }
    QVCTXMLParser parser(QVCTXMLParser::largestJson(data.size()));
    auto dictionary = parser.objectWithData(data);
    if (dictionary) return jsonText(PropertyList(std::move(*dictionary)), JsonStyle::pretty);
    if (parser.isTooLarge()) log(parser.error().message());
    return std::nullopt;
}

}  // namespace qvct
