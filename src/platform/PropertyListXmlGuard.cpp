#include "platform/PropertyListFile.h"
#include "platform/PropertyListGuard.h"
#include "platform/Text.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <libxml/parser.h>

namespace qvct {
namespace {

enum class Element { plist, dictionary, array, key, text, integer, real, date, data, flag };

std::optional<Element> elementNamed(std::string_view name) {
    // The most frequent ones first.
    constexpr std::array<std::pair<std::string_view, Element>, 11> names = {{{"key", Element::key},
                                                                             {"string", Element::text},
                                                                             {"dict", Element::dictionary},
                                                                             {"integer", Element::integer},
                                                                             {"real", Element::real},
                                                                             {"true", Element::flag},
                                                                             {"false", Element::flag},
                                                                             {"array", Element::array},
                                                                             {"date", Element::date},
                                                                             {"data", Element::data},
                                                                             {"plist", Element::plist}}};
    const auto* hit =
        std::find_if(names.begin(), names.end(), [name](const auto& entry) { return entry.first == name; });
    return hit == names.end() ? std::nullopt : std::optional(hit->second);
}

bool isScalar(Element element) {
    return element == Element::integer || element == Element::real || element == Element::date;
}

bool isSpace(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

bool isBase64(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '+' ||
           c == '/' || c == '=' || isSpace(c);
}

/// Takes a number from the front of the text. Whether there is one.
template <typename Number, typename... Options>
bool takeNumber(std::string_view& text, Number& number, Options... options) {
    const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), number, options...);
    text.remove_prefix(static_cast<std::size_t>(end - text.data()));
    return status == std::errc{};
}

/// Whether it is a whole number, decimal or hexadecimal, that 64 bits hold.
bool isInteger(std::string_view text) {
    const bool negative = text.starts_with('-');
    if (negative || text.starts_with('+')) text.remove_prefix(1);
    const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (hexadecimal) text.remove_prefix(2);
    std::uint64_t magnitude = 0;
    return takeNumber(text, magnitude, hexadecimal ? 16 : 10) && text.empty() &&
           (!negative || magnitude <= 1ULL << 63U);
}

/// Whether it is a number, "inf" or "nan"; one out of range is as near as there is.
bool isReal(std::string_view text) {
    if (text.starts_with('+')) text.remove_prefix(1);
    double number = 0;
    const auto [end, status] = std::from_chars(text.data(), text.data() + text.size(), number);
    return status != std::errc::invalid_argument && end == text.data() + text.size();
}

/// Whether it is a date and time such as "2001-12-31T23:59:59Z", in the range that is written, too.
bool isDate(std::string_view text) {
    std::array<unsigned, 6> fields{};
    constexpr std::string_view separators = "--T::Z";
    for (std::size_t i = 0; i < fields.size(); ++i) {
        if (!takeNumber(text, fields[i]) || !text.starts_with(separators[i])) return false;
        text.remove_prefix(1);
    }
    using namespace std::chrono;
    const auto [y, m, d, hour, minute, second] = fields;
    if (!text.empty() || y > 9999 || m > 12 || d > 31 || hour > 23 || minute > 59 || second > 60)
        return false;
    const year_month_day date(year(static_cast<int>(y)), month(m), day(d));
    const duration<double> sinceReference =
        sys_days(date) - sys_days(year(2001) / January / 1) + hours(hour) + minutes(minute) + seconds(second);
    return date.ok() && isPropertyListDate(sinceReference.count());
}

/// Follows the events of the XML parser and says the first thing that no property list has. `where` tells the
/// offset of an event's first byte, when it is asked.
class Grammar {
  public:
    explicit Grammar(std::size_t mostElements) : elementsLeft_(mostElements) {}

    template <typename Where>
    void start(std::string_view name, bool isPrefixed, Where where) {
        const auto element = isPrefixed ? std::nullopt : elementNamed(name);
        if (!element) return refuse("an element that is none of a property list", where());
        if (!mayStandHere(*element)) return refuse("an element where it may not stand", where());
        const bool isContainer = *element == Element::dictionary || *element == Element::array;
        if (isContainer && open_.size() > static_cast<std::size_t>(kDeepestPropertyList)) {
            return refuse("nested too deeply", where(), kErrorTooLarge);
        }
        if (elementsLeft_-- == 0) return refuse("too many keys and values", where(), kErrorTooLarge);
        if (!open_.empty()) ++open_.back().children;
        open_.push_back({*element, 0, isScalar(*element) ? where() : 0});
        scalar_.clear();
    }

    template <typename Where>
    void text(std::string_view characters, Where where) {
        if (open_.empty()) return;
        const Element element = open_.back().element;
        if (element == Element::key || element == Element::text) return;
        if (isScalar(element)) {
            scalar_ += characters;
            return;
        }
        const bool isData = element == Element::data;
        const auto fault =
            std::find_if_not(characters.begin(), characters.end(), isData ? isBase64 : isSpace);
        if (fault == characters.end()) return;
        refuse(isData ? "data that is not base 64" : "text between elements",
               where() + static_cast<std::size_t>(fault - characters.begin()));
    }

    template <typename Where>
    void end(Where where) {
        const Open closed = open_.back();
        open_.pop_back();
        const std::string_view scalar =
            isScalar(closed.element) ? trimBlanksAndLineBreaks(scalar_) : std::string_view{};
        switch (closed.element) {
            case Element::dictionary:
                if (closed.children % 2 != 0) refuse("a key without value", where());
                break;
            case Element::plist:
                if (closed.children == 0) refuse("no value", where());
                break;
            case Element::integer:
                if (!isInteger(scalar)) refuse("not a whole number of 64 bits", closed.offset);
                break;
            case Element::real:
                if (!isReal(scalar)) refuse("not a number", closed.offset);
                break;
            case Element::date:
                if (!isDate(scalar)) refuse("not a date and time of the years 1 to 9999", closed.offset);
                break;
            default:
                break;
        }
        isComplete_ = open_.empty() && !fault_;
    }

    void refuse(std::string_view reason, std::size_t offset, ErrorCode code = kErrorMalformed) {
        if (!fault_) fault_ = PropertyListFault{code, offset, std::string(reason)};
    }

    bool isComplete() const { return isComplete_; }
    const std::optional<PropertyListFault>& fault() const { return fault_; }

  private:
    struct Open {
        Element element;
        std::size_t children;
        std::size_t offset;  // of a scalar
    };

    bool mayStandHere(Element element) const {
        if (open_.empty()) return element == Element::plist;
        const Open& parent = open_.back();
        if (element == Element::plist) return false;
        switch (parent.element) {
            case Element::plist:
                return element != Element::key && parent.children == 0;
            case Element::array:
                return element != Element::key;
            case Element::dictionary:
                return (element == Element::key) == (parent.children % 2 == 0);
            default:
                return false;
        }
    }

    std::size_t elementsLeft_;
    std::vector<Open> open_;
    std::string scalar_;  // of a number or date
    std::optional<PropertyListFault> fault_;
    bool isComplete_ = false;
};

std::string_view view(const xmlChar* text) {
    return reinterpret_cast<const char*>(text);
}

/// The parser, fed at once and stopped at the first fault or at the end of the root element.
class Parser {
  public:
    explicit Parser(std::string_view text) : text_(text), grammar_(mostPropertyListValues(text.size())) {
        xmlSAXHandler handler{};
        handler.initialized = XML_SAX2_MAGIC;
        handler.startElementNs = [](void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar*,
                                    int, const xmlChar**, int, int, const xmlChar**) {
            tell(self, [&](Parser& p) {
                p.grammar_.start(view(name), prefix != nullptr, [&p] { return p.lastTag(); });
            });
        };
        handler.endElementNs = [](void* self, const xmlChar*, const xmlChar*, const xmlChar*) {
            tell(self, [](Parser& p) { p.grammar_.end([&p] { return p.lastTag(); }); });
        };
        handler.characters = handler.cdataBlock = [](void* self, const xmlChar* part, int length) {
            tell(self, [&](Parser& p) {
                p.grammar_.text({reinterpret_cast<const char*>(part), static_cast<std::size_t>(length)},
                                [&] { return p.offsetOf(part); });
            });
        };
        // Entities of one's own multiply; nothing that writes property lists makes any.
        handler.entityDecl = [](void* self, const xmlChar*, int, const xmlChar*, const xmlChar*, xmlChar*) {
            tell(self, [](Parser& p) { p.grammar_.refuse("an entity declaration", p.lastTag()); });
        };
        handler.reference = [](void* self, const xmlChar*) {
            tell(self, [](Parser& p) { p.grammar_.refuse("an unknown entity", p.offset()); });
        };
        handler.serror = [](void* self, xmlErrorPtr error) {
            auto& parser = *static_cast<Parser*>(self);
            if (error->level != XML_ERR_FATAL || parser.isStopped_) return;
            const bool isAboutATag = error->code == XML_ERR_TAG_NAME_MISMATCH;
            parser.grammar_.refuse("not well-formed XML", isAboutATag ? parser.lastTag() : parser.offset());
            parser.isStopped_ = true;  // the parser stops by itself, and must not be stopped amid an error
        };
        context_.reset(xmlCreatePushParserCtxt(&handler, this, nullptr, 0, nullptr));
        // Its own limit of depth lies below ours; the encoding is known, and not always the declared one.
        if (context_)
            xmlCtxtUseOptions(context_.get(), XML_PARSE_NONET | XML_PARSE_HUGE | XML_PARSE_IGNORE_ENC);
    }

    std::optional<PropertyListFault> parse(std::size_t& end) {
        if (context_) xmlParseChunk(context_.get(), text_.data(), static_cast<int>(text_.size()), 1);
        end = stoppedAt_;
        if (grammar_.isComplete()) return std::nullopt;
        if (grammar_.fault()) return grammar_.fault();
        return PropertyListFault{kErrorMalformed, text_.size(), "it ends too early"};
    }

  private:
    struct Deleter {
        void operator()(xmlParserCtxt* context) const {
            xmlFreeDoc(context->myDoc);
            xmlFreeParserCtxt(context);
        }
    };

    template <typename Event>
    static void tell(void* self, Event event) {
        auto& parser = *static_cast<Parser*>(self);
        if (parser.isStopped_) return;
        event(parser);
        if (!parser.grammar_.fault() && !parser.grammar_.isComplete()) return;
        parser.isStopped_ = true;
        parser.stoppedAt_ = parser.offset();
        xmlStopParser(parser.context_.get());
    }

    /// How far the parser has come.
    std::size_t offset() const {
        const long consumed = xmlByteConsumed(context_.get());
        return std::min(static_cast<std::size_t>(std::max(consumed, 0L)), text_.size());
    }

    /// Where the tag begins that the parser has just read.
    std::size_t lastTag() const {
        const std::size_t here = offset();
        const std::size_t tag = here == 0 ? std::string_view::npos : text_.rfind('<', here - 1);
        return tag == std::string_view::npos ? here : tag;
    }

    /// Where the characters stand that the parser hands out: mostly in its input, else just before.
    std::size_t offsetOf(const xmlChar* characters) const {
        const xmlParserInput& input = *context_->input;
        if (characters >= input.base && characters < input.end)
            return offset() - static_cast<std::size_t>(input.cur - characters);
        const std::size_t here = offset();
        const std::size_t tag = here == 0 ? std::string_view::npos : text_.rfind('>', here - 1);
        return tag == std::string_view::npos ? here : tag + 1;
    }

    std::string_view text_;
    Grammar grammar_;
    bool isStopped_ = false;
    std::size_t stoppedAt_ = 0;
    std::unique_ptr<xmlParserCtxt, Deleter> context_;
};

}  // namespace

std::optional<PropertyListFault> faultOfXmlPropertyList(std::string_view text, std::size_t& end) {
    return Parser(text).parse(end);
}

}  // namespace qvct
