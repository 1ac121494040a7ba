#pragma once

#include "platform/data/PropertyList.h"
#include "platform/data/propertylist/PropertyListPlace.h"

#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Builds a property list, however deep, without recursion from its parts in the order of the text.
///
/// When a key comes twice, its last value takes the place of the first, as in most readers.
class PropertyListBuilder {
  public:
    /// XML has no element for a UID: it is a dictionary with this one key, and a number that is not negative.
    static constexpr std::string_view kUidKey = "CF$UID";

    void openDictionary() { open_.push_back({PropertyList::Dictionary{}, {}}); }
    void openArray() { open_.push_back({PropertyList::Array{}, {}}); }
    /// The key of the value that comes next, in a dictionary.
    void key(std::string key) { open_.back().key = std::move(key); }
    /// A value that holds no others.
    void add(PropertyList value);
    /// Ends the innermost container.
    void close();
    /// How many containers are open.
    std::size_t depth() const { return open_.size(); }
    /// Whether the innermost container is a dictionary.
    bool isInDictionary() const { return open_.back().container.dictionary() != nullptr; }
    /// Whether the value that comes next is the one at the path.
    bool isNext(const PropertyListPath& path) const;
    /// What was built, all containers being closed.
    PropertyList take() { return std::move(root_); }

  private:
    struct Open {
        PropertyList container;
        std::string key;
    };

    std::vector<Open> open_;
    PropertyList root_ = false;
};

}  // namespace qvct
