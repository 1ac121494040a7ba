#include "platform/data/xml/XmlParsing.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <array>
#include <limits>
#include <optional>

#include <fmt/format.h>
#include <libxml/SAX2.h>
#include <libxml/parser.h>
#include <libxml/tree.h>

namespace qvct {
namespace {

/// Limited, since a damaged document may cause a fault on every line.
constexpr std::size_t kMostFaults = 5;

/// Declaring one of these changes nothing for the library: it knows the width of characters from the first
/// bytes.
constexpr std::array<std::string_view, 4> kUnswitchedEncodings = {"utf-8", "utf8", "utf-16", "utf16"};

/// How the names of those encodings begin in which the bytes of markup occur in no other character. Encodings
/// with shift sequences, such as ISO 2022, are not among them.
constexpr std::array<std::string_view, 21> kAsciiEncodings = {
    "ascii",     "us-ascii",  "iso-8859", "iso8859", "latin", "iso_8859",  "windows-",
    "cp125",     "cp85",      "cp86",     "gb",      "big5",  "x-sjis",    "sjis",
    "shift_jis", "shift-jis", "euc-",     "x-euc",   "koi8-", "macintosh", "x-mac-"};

/// How many bytes a character of markup takes, and which of them holds its ASCII code.
struct Characters {
    std::size_t width = 1;
    std::size_t letter = 0;
};

/// What the library concludes from the first bytes.
Characters charactersOf(std::string_view text) {
    using namespace std::string_view_literals;
    if (text.starts_with("<\0\0\0"sv)) return {4, 0};
    if (text.starts_with("\0\0\0<"sv)) return {4, 3};
    if (text.starts_with("<\0?\0"sv) || text.starts_with("\xFF\xFE"sv)) return {2, 0};
    if (text.starts_with("\0<\0?"sv) || text.starts_with("\xFE\xFF"sv)) return {2, 1};
    return {};
}

/// A byte for each wide character: its letter, or a question mark for what is no markup.
std::string narrowed(std::string_view text, Characters characters) {
    std::string narrow(text.size() / characters.width, '?');
    for (std::size_t i = 0; i < narrow.size(); ++i) {
        const std::string_view wide = text.substr(i * characters.width, characters.width);
        const char letter = wide[characters.letter];
        const auto zeros = static_cast<std::size_t>(std::count(wide.begin(), wide.end(), '\0'));
        if (letter > 0 && zeros + 1 == characters.width) narrow[i] = letter;
    }
    return narrow;
}

/// The XML declaration behind a byte order mark, up to its end or the most that is looked at.
std::string_view declarationOf(std::string_view text) {
    constexpr std::size_t longest = 1024, longestMark = 3;
    const std::string_view start = text.substr(0, longest);
    const std::size_t declaration = start.find("<?xml");
    if (declaration == std::string_view::npos || declaration > longestMark) return {};
    const std::size_t end = start.find("?>", declaration);
    return start.substr(declaration, end == std::string_view::npos ? end : end + 2 - declaration);
}

/// The declared encoding in small letters, if there is one.
std::optional<std::string> declaredEncoding(std::string_view declaration) {
    const std::size_t word = declaration.find("encoding");
    const std::size_t quote = word == std::string_view::npos ? word : declaration.find_first_of("'\"", word);
    if (quote == std::string_view::npos) return std::nullopt;
    const std::string_view name = declaration.substr(quote + 1);
    return lowercase(name.substr(0, name.find(declaration[quote])));
}

/// Whether the library reads the markup as it is seen here, a byte for each of its characters.
bool hasKnownMarkup(std::string_view narrow, bool isWide, Error* error) {
    constexpr std::string_view declarationInEbcdic = "\x4C\x6F\xA7\x94";
    if (narrow.starts_with(declarationInEbcdic)) return fail(error, kErrorMalformed, "EBCDIC", {.line = 1});
    const std::string_view declaration = declarationOf(narrow);
    if (!declaration.empty() && !declaration.ends_with("?>"))
        return fail(error, kErrorMalformed, "an XML declaration that is too long, or does not end",
                    {.line = 1});
    const std::optional<std::string> name = declaredEncoding(declaration);
    if (!name || std::find(kUnswitchedEncodings.begin(), kUnswitchedEncodings.end(), *name) !=
                     kUnswitchedEncodings.end())
        return true;
    const bool isKnown =
        !isWide && std::any_of(kAsciiEncodings.begin(), kAsciiEncodings.end(),
                               [&](std::string_view start) { return name->starts_with(start); });
    return isKnown ||
           fail(error, kErrorMalformed,
                fmt::format("texts in the encoding \"{}\" are not read", printable(*name)), {.line = 1});
}

/// The offset of the quote that opens the value after the "=" at `equals`; the text's size when there is
/// none.
std::size_t valueBehind(std::string_view text, std::size_t equals) {
    std::size_t at = equals + 1;
    while (at < text.size() && isAsciiBlank(text[at])) ++at;
    return at < text.size() && (text[at] == '"' || text[at] == '\'') ? at : text.size();
}

/// The library counts from 1, and says 0 where it has no line.
ErrorPlace placeOfLine(int line) {
    ErrorPlace place;
    if (line > 0) place.line = static_cast<std::uint64_t>(line);
    return place;
}

/// Keeps the XML library's messages, and ends the parsing of what grows too large.
class Parser {
  public:
    explicit Parser(std::string_view text)
        : text_(text), mostNodes_(kMostXmlNodes + text.size() / kXmlBytesOfNode) {}

    ParsedXml parse() {
        prepareXmlLibrary();
        context_.reset(xmlNewParserCtxt());
        if (!context_ || text_.size() > static_cast<std::size_t>(std::numeric_limits<int>::max())) {
            result_.faults.push_back(errorOf(kErrorTooLarge, "too large to be parsed"));
            return std::move(result_);
        }
        Error error;
        if (!hasFewAttributes(text_, &error)) {
            result_.faults.push_back(std::move(error));
            return std::move(result_);
        }
        context_->_private = this;
        context_->sax->serror = [](void* context, xmlErrorPtr raised) {
            of(context).addFault(kErrorMalformed, raised->line,
                                 raised->message == nullptr ? "unknown fault" : raised->message);
        };
        context_->sax->startElementNs = startElement;
        context_->sax->entityDecl = declareEntity;
        context_->sax->attributeDecl = declareAttribute;
        result_.tree.reset(xmlCtxtReadMemory(context_.get(), text_.data(), static_cast<int>(text_.size()),
                                             nullptr, nullptr, XML_PARSE_RECOVER | XML_PARSE_NONET));
        result_.isWellFormed = result_.tree != nullptr && context_->wellFormed != 0 && !isStopped_;
        return std::move(result_);
    }

  private:
    static Parser& of(void* context) {
        return *static_cast<Parser*>(static_cast<xmlParserCtxt*>(context)->_private);
    }

    void addFault(ErrorCode code, int line, std::string_view reason) {
        if (result_.faults.size() == kMostFaults) {
            ++result_.moreFaults;
        } else {
            result_.faults.push_back(
                errorOf(code, std::string(trimBlanksAndLineBreaks(reason)), placeOfLine(line)));
        }
    }

    void stop(std::string_view reason) {
        isStopped_ = true;
        addFault(kErrorTooLarge, context_->input == nullptr ? 0 : context_->input->line, reason);
        xmlStopParser(context_.get());
    }

    static void startElement(void* context, const xmlChar* name, const xmlChar* prefix, const xmlChar* uri,
                             int nameSpaceCount, const xmlChar** nameSpaces, int attributeCount,
                             int defaultedCount, const xmlChar** attributes) {
        Parser& self = of(context);
        self.nodes_ += 1 + static_cast<std::size_t>(attributeCount);
        if (self.nodes_ > self.mostNodes_) {
            return self.stop(
                fmt::format("more than {} elements and attributes; the rest is left out", self.mostNodes_));
        }
        const int inScope = self.context_->nsNr / 2;  // a prefix and an address each
        if (inScope > kMostXmlNameSpaces) {
            return self.stop(
                fmt::format("more than {} name spaces; the rest is left out", kMostXmlNameSpaces));
        }
        xmlSAX2StartElementNs(context, name, prefix, uri, nameSpaceCount, nameSpaces, attributeCount,
                              defaultedCount, attributes);
    }

    /// The content is parsed where the entity is used, in the form in which it is given here: with character
    /// references replaced.
    static void declareEntity(void* context, const xmlChar* name, int type, const xmlChar* publicId,
                              const xmlChar* systemId, xmlChar* content) {
        const auto* text = reinterpret_cast<const char*>(content);
        if (text != nullptr && attributeTooMany(text)) {
            return of(context).stop(fmt::format(
                "an entity with more than {} attributes; the rest is left out", kMostXmlAttributes));
        }
        xmlSAX2EntityDecl(context, name, type, publicId, systemId, content);
    }

    static void declareAttribute(void* context, const xmlChar* element, const xmlChar* name, int type,
                                 int standard, const xmlChar* value, xmlEnumerationPtr choices) {
        Parser& self = of(context);
        if (++self.declarations_ <= kMostXmlAttributes)
            return xmlSAX2AttributeDecl(context, element, name, type, standard, value, choices);
        xmlFreeEnumeration(choices);
        self.stop(fmt::format("more than {} attributes declared; the rest is left out", kMostXmlAttributes));
    }

    std::string_view text_;
    std::size_t mostNodes_;
    XmlOwned<xmlParserCtxt> context_;
    ParsedXml result_;
    std::size_t nodes_ = 0;
    int declarations_ = 0;
    bool isStopped_ = false;
};

}  // namespace

ParsedXml parseXml(std::string_view text) {
    return Parser(text).parse();
}

std::optional<std::size_t> attributeTooMany(std::string_view text) {
    std::size_t at = 0;
    while ((at = text.find('<', at)) != std::string_view::npos) {
        int count = 0;
        // A "<" always ends the attributes of a tag, however malformed the text is.
        for (++at; at < text.size() && text[at] != '<' && text[at] != '>'; ++at) {
            if (text[at] != '=') continue;
            const std::size_t quote = valueBehind(text, at);
            if (quote == text.size()) continue;
            if (++count > kMostXmlAttributes) return at;
            at = quote + 1;
            while (at < text.size() && text[at] != text[quote] && text[at] != '<') ++at;
            if (at < text.size() && text[at] == '<') --at;  // ends the tag in the next turn
        }
    }
    return std::nullopt;
}

bool hasFewAttributes(std::string_view text, Error* error) {
    const Characters characters = charactersOf(text);
    const bool isWide = characters.width > 1;
    const std::string letters = isWide ? narrowed(text, characters) : std::string();
    const std::string_view narrow = isWide ? letters : text;
    if (!hasKnownMarkup(narrow, isWide, error)) return false;
    const auto offset = attributeTooMany(narrow);
    return !offset || fail(error, kErrorTooLarge,
                           fmt::format("an element with more than {} attributes", kMostXmlAttributes),
                           {.line = lineAt(narrow, *offset)});
}

}  // namespace qvct
