#include "platform/data/xml/XmlDocument.h"

#include "platform/base/bytes/BytesAsText.h"
#include "platform/data/xml/XmlParsing.h"
#include "platform/files/FileAccess.h"
#include "platform/files/reading/Decompression.h"

#include <libxml/tree.h>
#include <libxml/xpath.h>
#include <libxml/xpathInternals.h>

namespace qvct {
namespace {

/// A file this large takes several times its size in memory once it is parsed.
constexpr std::uint64_t kLargestXmlFile = 64ULL << 20U;

}  // namespace

struct XmlDocument::Implementation {
    XmlOwned<xmlDoc> document;
};

XmlDocument::XmlDocument(std::unique_ptr<Implementation> implementation)
    : implementation_(std::move(implementation)) {}
XmlDocument::~XmlDocument() = default;

std::shared_ptr<XmlDocument> XmlDocument::fromFile(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error, kLargestXmlFile);
    if (!bytes) return nullptr;
    if (!path.ends_with(".zxml")) return fromText(textOf(*bytes), path, error);
    const auto xml = decompress(*bytes, error);
    if (xml) return fromText(textOf(*xml), path, error);
    failIn(path, error);
    return nullptr;
}

std::shared_ptr<XmlDocument> XmlDocument::fromText(std::string_view text, std::string_view name,
                                                   Error* error) {
    ParsedXml parsed = parseXml(text);
    if (!parsed.tree) {
        fail(error, kErrorMalformed, "no XML");
        if (error != nullptr && !parsed.faults.empty()) *error = std::move(parsed.faults.front());
        failIn(name, error);
        return nullptr;
    }
    auto implementation = std::make_unique<Implementation>();
    implementation->document = std::move(parsed.tree);
    return std::shared_ptr<XmlDocument>(new XmlDocument(std::move(implementation)));
}

std::vector<std::string> XmlDocument::attributeValues(const std::string& xpath,
                                                      const std::string& attribute) const {
    const XmlOwned<xmlXPathContext> context(xmlXPathNewContext(implementation_->document.get()));
    const XmlOwned<xmlXPathObject> result(
        context ? xmlXPathEvalExpression(xmlText(xpath.c_str()), context.get()) : nullptr);
    std::vector<std::string> values;
    if (!result || result->type != XPATH_NODESET || result->nodesetval == nullptr) return values;
    for (int i = 0; i < result->nodesetval->nodeNr; ++i) {
        const xmlNode* node = result->nodesetval->nodeTab[i];
        const XmlOwned<xmlChar> value(
            node->type == XML_ELEMENT_NODE ? xmlGetProp(node, xmlText(attribute.c_str())) : nullptr);
        values.emplace_back(viewOf(value.get()));
    }
    return values;
}

}  // namespace qvct
