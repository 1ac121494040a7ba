#pragma once

#include "platform/data/xml/XmlLibrary.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace qvct {

/// An XPath expression of the form that most rules have, whose first node is found by walking down the tree.
///
/// Covers absolute paths of child elements with predicates that compare attributes with constants:
/// `/A/B[2]/C[contains(@x,'y') and @z>=1]`. The grammar, with blanks between any two tokens:
///
///     expression = path | "(" path ")[" n "]"
///     path       = 1*("/" name *("[" (n | condition) "]"))
///     condition  = comparisons joined by "and", "or" and parentheses
///     comparison = "@" name [("=" | "!=") (text | number)] | "@" name ("<" | "<=" | ">" | ">=") number
///                | ("contains" | "starts-with") "(@" name "," text ")"
///
/// All other expressions are left to the XML library. For these, this gives the same answer in a tenth of the
/// time, since it builds no node sets and stops at the first node.
class LocationPath {
  public:
    /// Nothing when the expression is not of this form. The caller has seen that it is valid XPath.
    static std::optional<LocationPath> parse(std::string_view expression);

    /// The first node in document order, or null.
    /// @cost  O(nodes on the way to it), no allocation but for attributes that hold entity references.
    _xmlNode* firstNode(const _xmlDoc* document) const;

    enum class Relation {
        exists,
        equal,
        notEqual,
        less,
        lessOrEqual,
        greater,
        greaterOrEqual,
        contains,
        startsWith
    };
    using Constant = std::variant<std::monostate, double, std::string>;
    struct Comparison {
        std::string attribute;
        Relation relation = Relation::exists;
        Constant constant;
    };
    struct Condition {
        enum class Kind { comparison, conjunction, disjunction };
        Kind kind = Kind::comparison;
        Comparison comparison;
        std::vector<Condition> operands;
    };
    using Predicate = std::variant<std::uint32_t, Condition>;
    struct Step {
        std::string name;
        std::vector<Predicate> predicates;
    };

  private:
    std::vector<Step> steps_;
    std::uint32_t position_ = 1;  // of the node among those that the path selects

    friend class LocationPathParser;
};

}  // namespace qvct
