#include "autotagging/xml/XPathNames.h"

#include "platform/text/Text.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {
namespace {

/// The core functions, the tests of node types, and the operators, behind which a parenthesis may follow.
constexpr std::string_view kKnown[] = {"last",
                                       "position",
                                       "count",
                                       "id",
                                       "local-name",
                                       "namespace-uri",
                                       "name",
                                       "string",
                                       "concat",
                                       "starts-with",
                                       "contains",
                                       "substring-before",
                                       "substring-after",
                                       "substring",
                                       "string-length",
                                       "normalize-space",
                                       "translate",
                                       "boolean",
                                       "not",
                                       "true",
                                       "false",
                                       "lang",
                                       "number",
                                       "sum",
                                       "floor",
                                       "ceiling",
                                       "round",
                                       "comment",
                                       "text",
                                       "processing-instruction",
                                       "node",
                                       "and",
                                       "or",
                                       "div",
                                       "mod"};

bool beginsName(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_' ||
           static_cast<unsigned char>(c) >= 0x80;
}

bool continuesName(char c) {
    return beginsName(c) || (c >= '0' && c <= '9') || c == '-' || c == '.';
}

std::size_t endOf(std::string_view text, std::size_t at, bool (*isPart)(char)) {
    while (at < text.size() && isPart(text[at])) ++at;
    return at;
}

/// Why the name, which `rest` follows, is not defined; empty when it may be.
std::string problemOf(std::string_view name, std::string_view rest) {
    const std::string_view next = rest.substr(endOf(rest, 0, isAsciiBlank));
    if (rest.starts_with(':') && !rest.starts_with("::") && name != "xml")
        return fmt::format("undefined prefix \"{}\"", printable(name));
    const bool isCalled = next.starts_with('(');
    if (isCalled && std::find(std::begin(kKnown), std::end(kKnown), name) == std::end(kKnown))
        return fmt::format("unknown function \"{}\"", printable(name));
    return {};
}

}  // namespace

std::optional<UnknownXPathName> unknownXPathName(std::string_view expression) {
    for (std::size_t at = 0; at < expression.size();) {
        const char c = expression[at];
        if (c == '\'' || c == '"') {
            at = std::min(expression.find(c, at + 1), expression.size() - 1) + 1;
        } else if (c == '$') {
            return UnknownXPathName{at, "undefined variable"};
        } else if (beginsName(c)) {
            const std::size_t end = endOf(expression, at, continuesName);
            std::string problem = problemOf(expression.substr(at, end - at), expression.substr(end));
            if (!problem.empty()) return UnknownXPathName{at, std::move(problem)};
            at = end;
        } else {
            ++at;
        }
    }
    return std::nullopt;
}

}  // namespace qvct
