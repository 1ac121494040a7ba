#include "platform/PropertyListFile.h"
#include "platform/PropertyListGuard.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <fmt/format.h>
#include <libxml/parser.h>

namespace qvct {
namespace {

enum class Element { plist, dictionary, array, key, text, integer, data, flag };

std::optional<Element> elementNamed(std::string_view name) {
    constexpr std::array<std::pair<std::string_view, Element>, 11> names = {{{"plist", Element::plist},
                                                                             {"dict", Element::dictionary},
                                                                             {"array", Element::array},
                                                                             {"key", Element::key},
                                                                             {"string", Element::text},
                                                                             {"real", Element::text},
                                                                             {"date", Element::text},
                                                                             {"integer", Element::integer},
                                                                             {"data", Element::data},
                                                                             {"true", Element::flag},
                                                                             {"false", Element::flag}}};
    const auto* hit =
        std::find_if(names.begin(), names.end(), [name](const auto& entry) { return entry.first == name; });
    return hit == names.end() ? std::nullopt : std::optional(hit->second);
}

bool isSpace(char c) {
    return c == ' ' || c == '\t' || c == '\n' || c == '\r';
}

bool isBase64(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '+' ||
           c == '/' || c == '=' || isSpace(c);
}

/// Whether it is a whole number, decimal or hexadecimal, that 64 bits hold.
bool isInteger(std::string_view text) {
    while (!text.empty() && isSpace(text.front())) text.remove_prefix(1);
    while (!text.empty() && isSpace(text.back())) text.remove_suffix(1);
    const bool negative = text.starts_with('-');
    if (negative || text.starts_with('+')) text.remove_prefix(1);
    const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (hexadecimal) text.remove_prefix(2);
    std::uint64_t magnitude = 0;
    const auto [end, status] =
        std::from_chars(text.data(), text.data() + text.size(), magnitude, hexadecimal ? 16 : 10);
    return status == std::errc{} && end == text.data() + text.size() &&
           (!negative || magnitude <= 1ULL << 63U);
}

/// Follows the events of the XML parser and says the first thing that no property list has.
class Grammar {
  public:
    void start(std::string_view name, bool isPrefixed) {
        const auto element = isPrefixed ? std::nullopt : elementNamed(name);
        if (!element) return refuse("an element that is none of a property list");
        if (!mayStandHere(*element)) return refuse("an element where it may not stand");
        if (open_.size() > static_cast<std::size_t>(kDeepestPropertyList)) {
            tooDeep_ = true;
            return refuse("nested too deeply");
        }
        if (!open_.empty()) ++open_.back().children;
        open_.push_back({*element, 0});
        integer_.clear();
    }

    void text(std::string_view characters) {
        if (open_.empty()) return;
        const Element element = open_.back().element;
        if (element == Element::integer) integer_ += characters;
        if (element == Element::data && !std::all_of(characters.begin(), characters.end(), isBase64)) {
            refuse("data that is not base 64");
        }
        const bool holdsText = element == Element::key || element == Element::text ||
                               element == Element::integer || element == Element::data;
        if (!holdsText && !std::all_of(characters.begin(), characters.end(), isSpace)) {
            refuse("text between elements");
        }
    }

    void end() {
        const Open closed = open_.back();
        open_.pop_back();
        if (closed.element == Element::dictionary && closed.children % 2 != 0) refuse("a key without value");
        if (closed.element == Element::plist && closed.children == 0) refuse("no value");
        if (closed.element == Element::integer && !isInteger(integer_))
            refuse("not a whole number of 64 bits");
        isComplete_ = open_.empty() && fault_.empty();
    }

    void refuse(std::string_view fault) {
        if (fault_.empty()) fault_ = fault;
    }

    bool isComplete() const { return isComplete_; }
    bool isTooDeep() const { return tooDeep_; }
    const std::string& fault() const { return fault_; }

  private:
    struct Open {
        Element element;
        std::size_t children;
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

    std::vector<Open> open_;
    std::string integer_;
    std::string fault_;
    bool isComplete_ = false;
    bool tooDeep_ = false;
};

std::string_view view(const xmlChar* text) {
    return reinterpret_cast<const char*>(text);
}

/// The parser, fed at once and stopped at the first fault or at the end of the root element: what may stand
/// behind it is nobody's business.
class Parser {
  public:
    Parser() {
        xmlSAXHandler handler{};
        handler.initialized = XML_SAX2_MAGIC;
        handler.startElementNs = [](void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar*,
                                    int, const xmlChar**, int, int, const xmlChar**) {
            tell(self, [&](Grammar& grammar) { grammar.start(view(name), prefix != nullptr); });
        };
        handler.endElementNs = [](void* self, const xmlChar*, const xmlChar*, const xmlChar*) {
            tell(self, [](Grammar& grammar) { grammar.end(); });
        };
        handler.characters = handler.cdataBlock = [](void* self, const xmlChar* text, int length) {
            tell(self, [&](Grammar& grammar) {
                grammar.text({reinterpret_cast<const char*>(text), static_cast<std::size_t>(length)});
            });
        };
        // Entities of one's own multiply; nothing that writes property lists makes any.
        handler.entityDecl = [](void* self, const xmlChar*, int, const xmlChar*, const xmlChar*, xmlChar*) {
            tell(self, [](Grammar& grammar) { grammar.refuse("an entity declaration"); });
        };
        handler.reference = [](void* self, const xmlChar*) {
            tell(self, [](Grammar& grammar) { grammar.refuse("an unknown entity"); });
        };
        context_.reset(xmlCreatePushParserCtxt(&handler, this, nullptr, 0, nullptr));
        // Its own limit of depth lies below ours.
        if (context_) xmlCtxtUseOptions(context_.get(), XML_PARSE_NONET | XML_PARSE_HUGE);
    }

    const Grammar& parse(std::span<const std::uint8_t> bytes) {
        if (!context_) return grammar_;
        xmlParseChunk(context_.get(), reinterpret_cast<const char*>(bytes.data()),
                      static_cast<int>(bytes.size()), 1);
        if (context_->wellFormed == 0 && !isStopped_) grammar_.refuse("not well-formed XML");
        return grammar_;
    }

    /// About where the parser stopped.
    long offset() const { return context_ ? xmlByteConsumed(context_.get()) : 0; }

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
        event(parser.grammar_);
        if (parser.grammar_.fault().empty() && !parser.grammar_.isComplete()) return;
        parser.isStopped_ = true;
        xmlStopParser(parser.context_.get());
    }

    Grammar grammar_;
    bool isStopped_ = false;
    std::unique_ptr<xmlParserCtxt, Deleter> context_;
};

}  // namespace

bool isSafeXmlPropertyList(std::span<const std::uint8_t> bytes, Error* error) {
    Parser parser;
    const Grammar& grammar = parser.parse(bytes);
    if (grammar.isComplete()) return true;
    return fail(error, grammar.isTooDeep() ? kErrorTooLarge : kErrorMalformed,
                fmt::format("XML property list, byte {}: {}", parser.offset(),
                            grammar.fault().empty() ? "it ends too early" : grammar.fault()));
}

}  // namespace qvct
