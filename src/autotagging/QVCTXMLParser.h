#pragma once

#include "platform/Error.h"
#include "platform/PropertyList.h"

#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

struct _xmlNode;  // NOLINT(bugprone-reserved-identifier): libxml2's name

namespace qvct {

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
    /// The container, or nothing when the text is not well-formed XML. Entities are replaced within the
    /// bounds of the XML library (declared ones only, none from outside), elements nest at most 256 deep.
    static std::optional<PropertyList::Dictionary> dictionaryForXMLData(std::string_view data);

    QVCTXMLParser();
    std::optional<PropertyList::Dictionary> objectWithData(std::string_view data);

    /// The last error of the parse; code 0 when there was none.
    const Error& error() const { return error_; }

    /// The events of a parse, in the order of the text.
    using Attributes = std::vector<std::pair<std::string, PropertyList>>;
    void didStartElement(std::string name, Attributes attributes);
    void didEndElement();
    void foundCharacters(std::string_view characters) { cdata_ += characters; }
    void parseErrorOccurred(Error error) { error_ = std::move(error); }

    /// The events that the element's own text would cause, without writing and reading it. Only for trees
    /// whose text would be well-formed and holds no references to entities, nested as deep as a parser reads.
    void didFindElement(const _xmlNode& element);
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

    Error error_;
    std::vector<Element> elements_;  // the first is the container
    std::string cdata_;
};

}  // namespace qvct
