#include "platform/data/propertylist/XmlPropertyListReader.h"

#include "platform/data/PropertyListFile.h"
#include "platform/data/propertylist/PropertyListBuilder.h"
#include "platform/data/propertylist/XmlPropertyListValues.h"
#include "platform/data/xml/XmlParsing.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <iterator>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <fmt/format.h>
#include <libxml/parser.h>

namespace qvct {
namespace {

enum class Element { plist, dictionary, array, key, text, integer, real, date, data, yes, no };

std::optional<Element> elementNamed(std::string_view name) {
    // The most frequent ones first.
    constexpr std::array<std::pair<std::string_view, Element>, 11> names = {{{"key", Element::key},
                                                                             {"string", Element::text},
                                                                             {"dict", Element::dictionary},
                                                                             {"integer", Element::integer},
                                                                             {"real", Element::real},
                                                                             {"true", Element::yes},
                                                                             {"false", Element::no},
                                                                             {"array", Element::array},
                                                                             {"date", Element::date},
                                                                             {"data", Element::data},
                                                                             {"plist", Element::plist}}};
    const auto* hit =
        std::find_if(names.begin(), names.end(), [name](const auto& entry) { return entry.first == name; });
    return hit == names.end() ? std::nullopt : std::optional(hit->second);
}

/// Whether the element holds characters: in others only blanks may stand, between elements.
bool holdsCharacters(Element element) {
    return element == Element::key || element == Element::text || element == Element::integer ||
           element == Element::real || element == Element::date || element == Element::data;
}

/// Builds the value from the events of the XML parser, and keeps the first fault: the first thing that may
/// not be in a property list. `where()` answers the offset of an event's first byte.
class Reader {
  public:
    Reader(std::size_t size, PropertyListPlace* wanted)
        : mostValues_(mostPropertyListValues(size)), wanted_(wanted) {}

    template <typename Where>
    void start(std::string_view name, bool isPrefixed, Where where) {
        const auto element = isPrefixed ? std::nullopt : elementNamed(name);
        if (!element) return refuse("an element that is none of a property list", where());
        if (!mayStandHere(*element)) return refuse("an element where it may not stand", where());
        if (++values_ > mostValues_) return refuse("too many keys and values", where(), kErrorTooLarge);
        const bool isContainer = *element == Element::dictionary || *element == Element::array;
        if (isContainer && builder_.depth() >= static_cast<std::size_t>(kDeepestPropertyList))
            return refuse("nested too deeply", where(), kErrorTooLarge);
        if (!open_.empty() && open_.back().element == Element::array) note(where);
        if (*element == Element::dictionary) builder_.openDictionary();
        if (*element == Element::array) builder_.openArray();
        if (!open_.empty()) ++open_.back().children;
        open_.push_back({*element, 0, holdsCharacters(*element) ? where() : 0});
        characters_.clear();
    }

    template <typename Where>
    void text(std::string_view characters, Where where) {
        if (open_.empty()) return;
        const Element element = open_.back().element;
        const bool isData = element == Element::data;
        const bool isFree = holdsCharacters(element) && !isData;
        const auto fault =
            isFree ? characters.end()
                   : std::find_if_not(characters.begin(), characters.end(), isData ? isBase64 : isAsciiBlank);
        if (fault != characters.end()) {
            refuse(isData ? "data that is not base 64" : "text between elements",
                   where() + static_cast<std::size_t>(fault - characters.begin()));
        } else if (isData) {
            std::remove_copy_if(characters.begin(), characters.end(), std::back_inserter(characters_),
                                isAsciiBlank);
        } else if (isFree) {
            characters_ += characters;
        }
    }

    template <typename Where>
    void end(Where where) {
        const Open closed = open_.back();
        open_.pop_back();
        switch (closed.element) {
            case Element::dictionary:
                if (closed.children % 2 != 0) return refuse("a key without value", where());
                [[fallthrough]];
            case Element::array:
                builder_.close();
                break;
            case Element::plist:
                if (closed.children == 0) return refuse("no value", where());
                isComplete_ = true;
                break;
            case Element::key:
                builder_.key(std::exchange(characters_, {}));
                note([&closed] { return closed.offset; });
                break;
            default:
                add(closed);
        }
    }

    void refuse(std::string_view reason, std::size_t offset, ErrorCode code = kErrorMalformed) {
        if (!fault_) fault_ = PropertyListFault{code, offset, std::string(reason)};
    }

    bool isComplete() const { return isComplete_; }
    const std::optional<PropertyListFault>& fault() const { return fault_; }
    PropertyList take() { return builder_.take(); }

  private:
    struct Open {
        Element element;
        std::size_t children;
        std::size_t offset;  // of its characters, where it holds some
    };

    /// Keeps the offset, if the value that comes next is the one that is looked for.
    template <typename Where>
    void note(Where where) {
        if (wanted_ != nullptr && builder_.isNext(wanted_->path)) wanted_->offset = where();
    }

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

    /// The value of an element that holds no others.
    void add(const Open& closed) {
        const std::string_view scalar = trimBlanksAndLineBreaks(characters_);
        switch (closed.element) {
            case Element::integer:
                return addIf(integerInXml(scalar), "not a whole number of 64 bits", closed.offset);
            case Element::real:
                return addIf(realInXml(scalar), "not a number", closed.offset);
            case Element::date:
                return addIf(dateInXml(scalar), "not a date and time of the years 1 to 9999", closed.offset);
            case Element::data:
                return addIf(dataInXml(characters_), "data that is not whole groups of base 64",
                             closed.offset);
            case Element::text:
                return builder_.add(std::exchange(characters_, {}));
            default:
                return builder_.add(closed.element == Element::yes);
        }
    }

    void addIf(std::optional<PropertyList> value, std::string_view fault, std::size_t offset) {
        if (!value) return refuse(fault, offset);
        builder_.add(*std::move(value));
    }

    std::size_t mostValues_;
    PropertyListPlace* wanted_;
    std::size_t values_ = 0;
    PropertyListBuilder builder_;
    std::vector<Open> open_;
    std::string characters_;  // of the innermost element
    std::optional<PropertyListFault> fault_;
    bool isComplete_ = false;
};

/// The parser, fed at once and stopped at the first fault or at the end of the root element.
class Parser {
  public:
    Parser(std::string_view text, PropertyListPlace* wanted) : text_(text), reader_(text.size(), wanted) {
        xmlSAXHandler handler{};
        handler.initialized = XML_SAX2_MAGIC;
        handler.startElementNs = [](void* self, const xmlChar* name, const xmlChar* prefix, const xmlChar*,
                                    int, const xmlChar**, int, int, const xmlChar**) {
            tell(self, [&](Parser& p) {
                if (p.context_->nsNr / 2 > kMostXmlNameSpaces)  // a prefix and an address each
                    return p.reader_.refuse("too many name spaces", p.lastTag(), kErrorTooLarge);
                p.reader_.start(viewOf(name), prefix != nullptr, [&p] { return p.lastTag(); });
            });
        };
        handler.endElementNs = [](void* self, const xmlChar*, const xmlChar*, const xmlChar*) {
            tell(self, [](Parser& p) { p.reader_.end([&p] { return p.lastTag(); }); });
        };
        handler.characters = handler.cdataBlock = [](void* self, const xmlChar* part, int length) {
            tell(self, [&](Parser& p) {
                p.reader_.text({reinterpret_cast<const char*>(part), static_cast<std::size_t>(length)},
                               [&] { return p.offsetOf(part); });
            });
        };
        // Declared entities can multiply the text; no program that writes property lists declares any.
        handler.entityDecl = [](void* self, const xmlChar*, int, const xmlChar*, const xmlChar*, xmlChar*) {
            tell(self, [](Parser& p) { p.reader_.refuse("an entity declaration", p.lastTag()); });
        };
        // Attributes mean nothing in a property list, and the parser compares each declaration with all
        // others.
        handler.attributeDecl = [](void* self, const xmlChar*, const xmlChar*, int, int, const xmlChar*,
                                   xmlEnumerationPtr choices) {
            xmlFreeEnumeration(choices);
            tell(self, [](Parser& p) { p.reader_.refuse("an attribute declaration", p.lastTag()); });
        };
        handler.reference = [](void* self, const xmlChar*) {
            tell(self, [](Parser& p) { p.reader_.refuse("an unknown entity", p.offset()); });
        };
        handler.serror = [](void* self, xmlErrorPtr error) {
            auto& parser = *static_cast<Parser*>(self);
            if (error->level != XML_ERR_FATAL || parser.isStopped_) return;
            const bool isAboutATag = error->code == XML_ERR_TAG_NAME_MISMATCH;
            parser.reader_.refuse("not well-formed XML", isAboutATag ? parser.lastTag() : parser.offset());
            parser.isStopped_ = true;  // the parser stops by itself, and must not be stopped amid an error
        };
        prepareXmlLibrary();
        context_.reset(xmlCreatePushParserCtxt(&handler, this, nullptr, 0, nullptr));
        // The library's limit of depth is below ours, so it is switched off; the encoding is known, and not
        // always the declared one.
        if (context_)
            xmlCtxtUseOptions(context_.get(), XML_PARSE_NONET | XML_PARSE_HUGE | XML_PARSE_IGNORE_ENC);
    }

    std::optional<PropertyList> parse(std::size_t& end, PropertyListFault& fault) {
        if (const auto offset = attributeTooMany(text_)) {
            reader_.refuse(fmt::format("an element with more than {} attributes", kMostXmlAttributes),
                           *offset, kErrorTooLarge);
        } else if (context_) {
            xmlParseChunk(context_.get(), text_.data(), static_cast<int>(text_.size()), 1);
        }
        end = stoppedAt_;
        if (reader_.isComplete()) return reader_.take();
        fault =
            reader_.fault().value_or(PropertyListFault{kErrorMalformed, text_.size(), "it ends too early"});
        return std::nullopt;
    }

  private:
    template <typename Event>
    static void tell(void* self, Event event) {
        auto& parser = *static_cast<Parser*>(self);
        if (parser.isStopped_) return;
        event(parser);
        if (!parser.reader_.fault() && !parser.reader_.isComplete()) return;
        parser.isStopped_ = true;
        parser.stoppedAt_ = parser.offset();
        xmlStopParser(parser.context_.get());
    }

    /// How far the parser has come.
    std::size_t offset() const {
        const long consumed = xmlByteConsumed(context_.get());
        return std::min(static_cast<std::size_t>(std::max(consumed, 0L)), text_.size());
    }

    /// The offset of the tag that the parser has just read.
    std::size_t lastTag() const {
        const std::size_t here = offset();
        const std::size_t tag = here == 0 ? std::string_view::npos : text_.rfind('<', here - 1);
        return tag == std::string_view::npos ? here : tag;
    }

    /// The offset of characters that the parser hands out. Mostly they point into its input; otherwise they
    /// begin behind the last tag.
    std::size_t offsetOf(const xmlChar* characters) const {
        const xmlParserInput& input = *context_->input;
        if (characters >= input.base && characters < input.end)
            return offset() - static_cast<std::size_t>(input.cur - characters);
        const std::size_t here = offset();
        const std::size_t tag = here == 0 ? std::string_view::npos : text_.rfind('>', here - 1);
        return tag == std::string_view::npos ? here : tag + 1;
    }

    std::string_view text_;
    Reader reader_;
    bool isStopped_ = false;
    std::size_t stoppedAt_ = 0;
    XmlOwned<xmlParserCtxt> context_;
};

}  // namespace

std::optional<PropertyList> parseXmlPropertyList(std::string_view text, std::size_t& end,
                                                 PropertyListFault& fault, PropertyListPlace* wanted) {
    return Parser(text, wanted).parse(end, fault);
}

}  // namespace qvct
