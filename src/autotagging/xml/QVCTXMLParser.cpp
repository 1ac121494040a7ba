#include "autotagging/xml/QVCTXMLParser.h"

#include "platform/data/xml/XmlParsing.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <limits>
#include <memory>

#include <fmt/format.h>
#include <libxml/SAX2.h>
#include <libxml/parser.h>
#include <libxml/parserInternals.h>

namespace qvct {
namespace {

/// Elements with fewer members are searched faster than looked up.
constexpr std::size_t kIndexedMembers = 16;
/// An ordinary element's.
constexpr std::size_t kUsualMembers = 4;

QVCTXMLParser& parserOf(void* context) {
    return *static_cast<QVCTXMLParser*>(static_cast<xmlParserCtxt*>(context)->_private);
}

Error errorAt(int line, ErrorCode code, std::string reason) {
    return errorOf(code, std::move(reason),
                   {.part = "XML", .line = static_cast<std::uint64_t>(std::max(line, 0))});
}

void stopIfTooLarge(void* context) {
    if (parserOf(context).isTooLarge()) xmlStopParser(static_cast<xmlParserCtxt*>(context));
}

void startElement(void* context, const xmlChar* name, const xmlChar** attributes) {
    QVCTXMLParser::Attributes members;
    members.reserve(kUsualMembers);
    for (; attributes != nullptr && *attributes != nullptr; attributes += 2) {
        members.emplace_back(viewOf(attributes[0]), viewOf(attributes[1]));
    }
    parserOf(context).didStartElement(std::string(viewOf(name)), std::move(members));
    stopIfTooLarge(context);
}

void endElement(void* context, const xmlChar* /*name*/) {
    parserOf(context).didEndElement();
}

void characters(void* context, const xmlChar* text, int length) {
    parserOf(context).foundCharacters(
        {reinterpret_cast<const char*>(text), static_cast<std::size_t>(length)});
    stopIfTooLarge(context);
}

/// Keeps only entities whose text stands in the document, so that nothing outside is ever read.
void declareEntity(void* context, const xmlChar* name, int type, const xmlChar* publicId,
                   const xmlChar* systemId, xmlChar* content) {
    if (attributeTooMany(viewOf(content))) {
        auto* stopped = static_cast<xmlParserCtxt*>(context);
        parserOf(context).parseErrorOccurred(
            errorAt(xmlSAX2GetLineNumber(stopped), kErrorTooLarge,
                    fmt::format("an entity with more than {} attributes", kMostXmlAttributes)));
        xmlStopParser(stopped);
    } else if (type == XML_INTERNAL_GENERAL_ENTITY) {
        xmlSAX2EntityDecl(context, name, type, publicId, systemId, content);
    }
}

void noMessage(void* /*context*/, const char* /*format*/, ...) {}

/// The interface without name spaces: names come as they are written.
xmlSAXHandler handlers() {
    xmlSAXHandler sax{};
    sax.startDocument = xmlSAX2StartDocument;
    sax.internalSubset = xmlSAX2InternalSubset;
    sax.entityDecl = declareEntity;
    sax.getEntity = xmlSAX2GetEntity;
    sax.startElement = startElement;
    sax.endElement = endElement;
    sax.characters = characters;
    sax.ignorableWhitespace = characters;
    sax.cdataBlock = characters;
    sax.warning = noMessage;
    sax.error = noMessage;
    sax.fatalError = noMessage;
    return sax;
}

/// The name as it is written.
std::string nameOf(const xmlNs* nameSpace, const xmlChar* name) {
    const bool hasPrefix = nameSpace != nullptr && nameSpace->prefix != nullptr;
    return hasPrefix ? fmt::format("{}:{}", viewOf(nameSpace->prefix), viewOf(name))
                     : std::string(viewOf(name));
}

/// Namespace declarations first, as the library writes them.
QVCTXMLParser::Attributes attributesOf(const xmlNode& element) {
    QVCTXMLParser::Attributes attributes;
    attributes.reserve(kUsualMembers);
    for (const xmlNs* declared = element.nsDef; declared != nullptr; declared = declared->next) {
        const std::string_view prefix = viewOf(declared->prefix);
        if (prefix == "xml") continue;  // declared by itself
        attributes.emplace_back(prefix.empty() ? std::string("xmlns") : fmt::format("xmlns:{}", prefix),
                                viewOf(declared->href));
    }
    for (const xmlAttr* attribute = element.properties; attribute != nullptr; attribute = attribute->next) {
        std::string value;
        for (const xmlNode* text = attribute->children; text != nullptr; text = text->next)
            value += viewOf(text->content);
        attributes.emplace_back(nameOf(attribute->ns, attribute->name), std::move(value));
    }
    return attributes;
}

Error lastError(const xmlParserCtxt& context) {
    const xmlError& last = context.lastError;
    const std::string_view reason = last.message == nullptr ? "not well-formed" : last.message;
    return errorAt(last.line, kErrorMalformed, std::string(trimBlanksAndLineBreaks(reason)));
}

}  // namespace

PropertyList* QVCTXMLParser::Element::member(const std::string& key) {
    if (members.size() < kIndexedMembers) {
        for (auto& [memberName, value] : members) {
            if (memberName == key) return &value;
        }
        return nullptr;
    }
    for (std::size_t i = positions.size(); i < members.size(); ++i) positions.emplace(members[i].first, i);
    const auto hit = positions.find(key);
    return hit == positions.end() ? nullptr : &members[hit->second].second;
}

void QVCTXMLParser::Element::add(std::string key, PropertyList value) {
    members.emplace_back(std::move(key), std::move(value));
}

PropertyList::Dictionary QVCTXMLParser::Element::takeDictionary() {
    PropertyList::Dictionary dictionary;
    dictionary.reserve(members.size());
    for (auto& [key, value] : members) dictionary.append(std::move(key), std::move(value));
    return dictionary;
}

std::size_t QVCTXMLParser::largestJson(std::size_t xmlBytes) {
    constexpr std::size_t always = std::size_t{1} << 20;
    constexpr std::size_t usualGrowth = 8;  // indented, an attribute takes five times its place
    return std::min(kLargestForJson, always + usualGrowth * std::min(xmlBytes, kLargestForJson));
}

QVCTXMLParser::QVCTXMLParser(std::size_t mostJson) : jsonLeft_(mostJson) {
    elements_.emplace_back();
}

bool QVCTXMLParser::takes(std::size_t jsonBytes) {
    isTooLarge_ |= jsonBytes > jsonLeft_;
    if (!isTooLarge_) jsonLeft_ -= jsonBytes;
    return !isTooLarge_;
}

std::optional<PropertyList::Dictionary> QVCTXMLParser::dictionaryForXMLData(std::string_view data) {
    return QVCTXMLParser(largestJson(data.size())).objectWithData(data);
}

std::optional<PropertyList::Dictionary> QVCTXMLParser::objectWithData(std::string_view data) {
    if (data.empty() || data.size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) {
        parseErrorOccurred(errorOf(kErrorMalformed, "no text, or far too much", {.part = "XML"}));
        return std::nullopt;
    }
    Error error;
    if (!hasFewAttributes(data, &error)) {
        parseErrorOccurred(std::move(error));
        return std::nullopt;
    }
    prepareXmlLibrary();
    const XmlOwned<xmlParserCtxt> context(
        xmlCreateMemoryParserCtxt(data.data(), static_cast<int>(data.size())));
    if (!context) return std::nullopt;
    xmlCtxtUseOptions(context.get(), XML_PARSE_NONET | XML_PARSE_NOENT | XML_PARSE_SAX1);
    *context->sax = handlers();
    context->_private = this;
    xmlParseDocument(context.get());
    if (isTooLarge_) {
        parseErrorOccurred(
            errorAt(xmlSAX2GetLineNumber(context.get()), kErrorTooLarge, "its JSON grows too large"));
        return std::nullopt;
    }
    if (error_.code != 0) return std::nullopt;  // stopped, which the library takes for well-formed
    if (context->wellFormed == 0) {
        parseErrorOccurred(lastError(*context));
        return std::nullopt;
    }
    return takeObject();
}

void QVCTXMLParser::didFindElement(const xmlNode& element) {
    didStartElement(nameOf(element.ns, element.name), attributesOf(element));
    for (const xmlNode* child = element.children; child != nullptr && !isTooLarge_; child = child->next) {
        if (child->type == XML_ELEMENT_NODE) {
            didFindElement(*child);
        } else if (child->type == XML_TEXT_NODE || child->type == XML_CDATA_SECTION_NODE) {
            foundCharacters(viewOf(child->content));
        }
    }
    didEndElement();
}

void QVCTXMLParser::didStartElement(std::string name, Attributes attributes) {
    constexpr std::size_t indentation = 4, punctuation = 8;
    const std::size_t line = punctuation + indentation * elements_.size();
    std::size_t json = 2 * line + name.size();  // it opens and closes
    for (const auto& [key, value] : attributes)
        json += line + indentation + key.size() + value.string()->size();
    if (!takes(json)) return;
    elements_.push_back({std::move(name), std::move(attributes), {}});
}

void QVCTXMLParser::foundCharacters(std::string_view characters) {
    if (takes(characters.size())) cdata_ += characters;
}

void QVCTXMLParser::didEndElement() {
    if (isTooLarge_) return;
    Element element = std::move(elements_.back());
    elements_.pop_back();
    if (!cdata_.empty()) {
        PropertyList text(trimBlanksAndLineBreaks(cdata_));
        if (PropertyList* existing = element.member("text")) {
            *existing = std::move(text);
        } else {
            element.add("text", std::move(text));
        }
        cdata_.clear();
    }
    addToParent(std::move(element.name), element.takeDictionary());
}

void QVCTXMLParser::addToParent(std::string name, PropertyList::Dictionary dictionary) {
    Element& parent = elements_.back();
    PropertyList* existing = parent.member(name);
    if (existing == nullptr) {
        parent.add(std::move(name), std::move(dictionary));
    } else if (PropertyList::Array* array = existing->array()) {
        array->emplace_back(std::move(dictionary));
    } else {
        PropertyList::Array both;
        both.push_back(std::move(*existing));
        both.emplace_back(std::move(dictionary));
        *existing = std::move(both);
    }
}

}  // namespace qvct
