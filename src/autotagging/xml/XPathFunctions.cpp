#include "autotagging/xml/XPathFunctions.h"

#include "platform/data/xml/XmlLibrary.h"

#include <cstring>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>

#include <libxml/xpathInternals.h>

namespace qvct {
namespace {

/// The last argument, as a text.
class PoppedText {
  public:
    explicit PoppedText(xmlXPathParserContext& parser) : text_(xmlXPathPopString(&parser)) {}
    const char* get() const { return text_ ? reinterpret_cast<const char*>(text_.get()) : ""; }
    std::string_view view() const { return get(); }
    xmlChar* release() { return text_.release(); }

  private:
    XmlOwned<xmlChar> text_;
};

bool hasArguments(xmlXPathParserContext& parser, int count, int wanted) {
    if (count != wanted) xmlXPathErr(&parser, XPATH_INVALID_ARITY);
    return count == wanted;
}

void returnText(xmlXPathParserContext& parser, std::string_view text) {
    if (parser.error != XPATH_EXPRESSION_OK) return;
    xmlChar* copy = xmlStrndup(xmlText(text.data()), static_cast<int>(text.size()));
    if (copy == nullptr) return xmlXPathErr(&parser, XPATH_MEMORY_ERROR);
    xmlXPathReturnString(&parser, copy);
}

void addWork(xmlXPathContext& context, std::size_t work) {
    context.opCount += work / static_cast<const XPathEvaluation*>(context.userData)->workOfStep;
}

void contains(xmlXPathParserContext* parser, int count) {
    if (!hasArguments(*parser, count, 2)) return;
    const PoppedText wanted(*parser), text(*parser);
    if (parser->error != XPATH_EXPRESSION_OK) return;
    xmlXPathReturnBoolean(parser, std::strstr(text.get(), wanted.get()) != nullptr ? 1 : 0);
}

void substringBefore(xmlXPathParserContext* parser, int count) {
    if (!hasArguments(*parser, count, 2)) return;
    const PoppedText wanted(*parser), text(*parser);
    const char* found = std::strstr(text.get(), wanted.get());
    const std::size_t size = found == nullptr ? 0 : static_cast<std::size_t>(found - text.get());
    returnText(*parser, text.view().substr(0, size));
}

void substringAfter(xmlXPathParserContext* parser, int count) {
    if (!hasArguments(*parser, count, 2)) return;
    const PoppedText wanted(*parser), text(*parser);
    const char* found = std::strstr(text.get(), wanted.get());
    returnText(*parser, found == nullptr ? "" : found + wanted.view().size());
}

std::string_view takeCharacter(std::string_view& text) {
    std::size_t size = 1;
    while (size < text.size() && (text[size] & 0xC0) == 0x80) ++size;
    const std::string_view character = text.substr(0, size);
    text.remove_prefix(size);
    return character;
}

void translate(xmlXPathParserContext* parser, int count) {
    if (!hasArguments(*parser, count, 3)) return;
    constexpr std::size_t workOfByte = 400;  // each character is looked up
    const PoppedText replacements(*parser), replaced(*parser), text(*parser);
    std::unordered_map<std::string_view, std::string_view> table;
    std::string_view from = replaced.view(), to = replacements.view();
    while (!from.empty()) {
        const std::string_view character = takeCharacter(from);
        const std::string_view other = to.empty() ? to : takeCharacter(to);
        table.emplace(character, other);  // the first one counts
    }
    addWork(*parser->context, (replaced.view().size() + text.view().size()) * workOfByte);
    std::string result;
    result.reserve(text.view().size());
    for (std::string_view rest = text.view(); !rest.empty();) {
        const std::string_view character = takeCharacter(rest);
        const auto hit = table.find(character);
        result += hit == table.end() ? character : hit->second;
    }
    returnText(*parser, result);
}

void normalizeSpace(xmlXPathParserContext* parser, int count) {
    if (count == 0) {
        xmlXPathStringFunction(parser, 0);  // of the context node
    } else if (!hasArguments(*parser, count, 1)) {
        return;
    }
    constexpr std::size_t workOfByte = 4;
    PoppedText popped(*parser);
    addWork(*parser->context, popped.view().size() * workOfByte);
    xmlChar* text = popped.release();
    if (text == nullptr) return;
    const xmlChar* from = text;
    xmlChar* to = text;
    bool isBlankDue = false;
    for (; *from != 0; ++from) {
        const bool isBlank = *from == ' ' || *from == '\t' || *from == '\r' || *from == '\n';
        if (!isBlank && isBlankDue) *to++ = ' ';
        if (!isBlank) *to++ = *from;
        isBlankDue = isBlank && to != text;
    }
    *to = 0;
    xmlXPathReturnString(parser, text);
}

}  // namespace

xmlXPathFunction linearXPathFunction(void* /*unused*/, const xmlChar* name, const xmlChar* nameSpace) {
    static const std::unordered_map<std::string_view, xmlXPathFunction> functions = {
        {"contains", contains},
        {"normalize-space", normalizeSpace},
        {"substring-after", substringAfter},
        {"substring-before", substringBefore},
        {"translate", translate}};
    if (nameSpace != nullptr) return nullptr;
    const auto hit = functions.find(viewOf(name));
    return hit == functions.end() ? nullptr : hit->second;
}

}  // namespace qvct
