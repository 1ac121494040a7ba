#pragma once

#include "platform/base/Error.h"
#include "platform/data/PropertyList.h"
#include "platform/data/xml/XmlLibrary.h"

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

namespace qvct {

/// Most XML that is turned into JSON for a script, and most JSON, in bytes.
inline constexpr std::size_t kLargestForJson = std::size_t{16} << 20;

/// Turns XML text into the tree of dictionaries that scripts are given as JSON.
///
/// The container has one member, named after the root element. An element is a dictionary of its attributes
/// (texts), its child elements by name (a dictionary for a single child, an array in document order for
/// several) and "text". Scripts are written against these properties, which therefore must stay:
/// - Character data belongs to the element whose end tag comes next: in `<a>x<b>y</b>z</a>`, b has the text
///   "xy" and a has "z". It is trimmed; blanks between tags give an empty "text".
/// - "text" replaces an attribute of that name.
/// - A child named like an attribute of its parent makes the member an array that starts with the attribute.
///
/// Names are taken as written, prefixes and namespace declarations included. A parser is for one parse.
class QVCTXMLParser {
  public:
    /// The container, or nothing when the text is not well-formed XML or its JSON would be too large
    /// (`largestJson`). Declared entities are replaced, none from outside; elements nest at most 256 deep.
    static std::optional<PropertyList::Dictionary> dictionaryForXMLData(std::string_view data);

    /// Most bytes of JSON, pretty printed and without escapes, that XML of so many bytes may become: entities
    /// multiply, and deep nesting is mostly indentation.
    static std::size_t largestJson(std::size_t xmlBytes);

    /// For XML that becomes at most about so many bytes of JSON.
    explicit QVCTXMLParser(std::size_t mostJson);
    std::optional<PropertyList::Dictionary> objectWithData(std::string_view data);

    /// The last error of the parse; code 0 when there was none.
    const Error& error() const { return error_; }

    /// The events of a parse, in the order of the text.
    using Attributes = std::vector<std::pair<std::string, PropertyList>>;
    void didStartElement(std::string name, Attributes attributes);
    void didEndElement();
    void foundCharacters(std::string_view characters);
    void parseErrorOccurred(Error error) { error_ = std::move(error); }

    /// Causes the events that parsing the element's own text would cause. Only for trees whose text would be
    /// well-formed, holds no references to entities, and is not nested deeper than a parser reads.
    void didFindElement(const _xmlNode& element);
    /// Whether the limit was reached; nothing that came afterwards was kept.
    bool isTooLarge() const { return isTooLarge_; }
    /// Takes the container with all that the events told.
    PropertyList::Dictionary takeObject() { return elements_.front().takeDictionary(); }

  private:
    /// An open element: its members in their order, found by name in constant time, since hostile documents
    /// have elements with a million different children.
    struct Element {
        std::string name;
        Attributes members;
        std::unordered_map<std::string, std::size_t> positions;

        PropertyList* member(const std::string& key);
        void add(std::string key, PropertyList value);
        PropertyList::Dictionary takeDictionary();
    };

    void addToParent(std::string name, PropertyList::Dictionary dictionary);
    bool takes(std::size_t jsonBytes);

    Error error_;
    std::vector<Element> elements_;  // the first is the container
    std::string cdata_;
    std::size_t jsonLeft_;
    bool isTooLarge_ = false;
};

}  // namespace qvct
