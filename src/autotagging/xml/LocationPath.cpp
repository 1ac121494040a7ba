#include "autotagging/xml/LocationPath.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>
#include <utility>

#include <libxml/tree.h>
#include <libxml/xpath.h>

namespace qvct {
namespace {

using Step = LocationPath::Step;
using Condition = LocationPath::Condition;
using Comparison = LocationPath::Comparison;
using Relation = LocationPath::Relation;

/// Most predicates of a step: for each of them positions are counted.
constexpr std::size_t kMostPredicates = 8;

bool isNamed(const xmlChar* name, const xmlNs* nameSpace, const std::string& wanted) {
    return nameSpace == nullptr && viewOf(name) == wanted;
}

const xmlAttr* attributeNamed(const xmlNode& element, const std::string& name) {
    const xmlAttr* attribute = element.properties;
    while (attribute != nullptr && !isNamed(attribute->name, attribute->ns, name))
        attribute = attribute->next;
    return attribute;
}

bool holdsNumber(Relation relation, double value, double constant) {
    switch (relation) {
        case Relation::equal:
            return value == constant;
        case Relation::notEqual:
            return value != constant;
        case Relation::less:
            return value < constant;
        case Relation::lessOrEqual:
            return value <= constant;
        case Relation::greater:
            return value > constant;
        case Relation::greaterOrEqual:
            return value >= constant;
        default:
            return false;
    }
}

bool holdsText(Relation relation, const char* value, const std::string& constant) {
    switch (relation) {
        case Relation::equal:
            return value == constant;
        case Relation::notEqual:
            return value != constant;
        case Relation::contains:
            return std::strstr(value, constant.c_str()) != nullptr;  // linear, whatever the texts
        case Relation::startsWith:
            return std::string_view(value).starts_with(constant);
        default:
            return false;
    }
}

bool holdsFor(const Comparison& comparison, const char* value) {
    if (const double* number = std::get_if<double>(&comparison.constant)) {
        return holdsNumber(comparison.relation, xmlXPathCastStringToNumber(xmlText(value)), *number);
    }
    return holdsText(comparison.relation, value, std::get<std::string>(comparison.constant));
}

bool holds(const Comparison& comparison, const xmlNode& element) {
    const xmlAttr* attribute = attributeNamed(element, comparison.attribute);
    if (comparison.relation == Relation::exists) return attribute != nullptr;
    if (attribute == nullptr) {
        // For a function a missing attribute is an empty text; with an operator it never compares true.
        const bool isFunction =
            comparison.relation == Relation::contains || comparison.relation == Relation::startsWith;
        return isFunction && holdsFor(comparison, "");
    }
    const xmlNode* text = attribute->children;
    if (text == nullptr) return holdsFor(comparison, "");
    if (text->type == XML_TEXT_NODE && text->next == nullptr && text->content != nullptr) {
        return holdsFor(comparison, reinterpret_cast<const char*>(text->content));
    }
    const XmlOwned<xmlChar> content(xmlNodeGetContent(reinterpret_cast<const xmlNode*>(attribute)));
    return holdsFor(comparison, content ? reinterpret_cast<const char*>(content.get()) : "");
}

bool holds(const Condition& condition, const xmlNode& element) {
    if (condition.kind == Condition::Kind::comparison) return holds(condition.comparison, element);
    const bool isConjunction = condition.kind == Condition::Kind::conjunction;
    for (const Condition& operand : condition.operands) {
        if (holds(operand, element) != isConjunction) return !isConjunction;
    }
    return isConjunction;
}

/// Walks down a path and counts what it selects.
class Walk {
  public:
    Walk(const std::vector<Step>& steps, std::uint32_t position) : steps_(steps), remaining_(position) {}

    /// The node at the wanted position among those that the steps from `depth` on select, or null.
    xmlNode* below(const xmlNode* firstChild, std::size_t depth) {
        const Step& step = steps_[depth];
        std::array<std::uint32_t, kMostPredicates> counts{};
        for (const xmlNode* child = firstChild; child != nullptr; child = child->next) {
            if (child->type != XML_ELEMENT_NODE || !isNamed(child->name, child->ns, step.name)) continue;
            if (!isSelected(*child, step, counts)) continue;
            if (depth + 1 < steps_.size()) {
                if (xmlNode* found = below(child->children, depth + 1)) return found;
            } else if (--remaining_ == 0) {
                return const_cast<xmlNode*>(child);  // the tree is the caller's
            }
        }
        return nullptr;
    }

  private:
    static bool isSelected(const xmlNode& element, const Step& step,
                           std::array<std::uint32_t, kMostPredicates>& counts) {
        for (std::size_t i = 0; i < step.predicates.size(); ++i) {
            const auto* position = std::get_if<std::uint32_t>(&step.predicates[i]);
            const bool passes = position != nullptr ? ++counts[i] == *position
                                                    : holds(std::get<Condition>(step.predicates[i]), element);
            if (!passes) return false;
        }
        return true;
    }

    const std::vector<Step>& steps_;
    std::uint32_t remaining_;
};

}  // namespace

xmlNode* LocationPath::firstNode(const _xmlDoc* document) const {
    return document == nullptr ? nullptr : Walk(steps_, position_).below(document->children, 0);
}

/// Reads the grammar from left to right; whatever does not fit makes the whole answer "not of this form".
class LocationPathParser {
  public:
    explicit LocationPathParser(std::string_view text) : rest_(text) {}

    std::optional<LocationPath> parse() {
        const bool isNumbered = take("(");
        if (!takePath() || (isNumbered && !takePosition())) return std::nullopt;
        skipBlanks();
        return rest_.empty() ? std::optional(std::move(path_)) : std::nullopt;
    }

  private:
    static constexpr int kDeepestCondition = 16;
    static constexpr std::size_t kMostSteps = 32;

    void skipBlanks() { rest_.remove_prefix(std::min(rest_.find_first_not_of(" \t\r\n"), rest_.size())); }

    bool take(std::string_view token) {
        skipBlanks();
        if (!rest_.starts_with(token)) return false;
        rest_.remove_prefix(token.size());
        return true;
    }

    static bool isLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_'; }
    static bool isDigit(char c) { return c >= '0' && c <= '9'; }
    static bool isNameCharacter(char c) { return isLetter(c) || isDigit(c) || c == '-' || c == '.'; }

    /// A name of ASCII letters. What goes on with a prefix, an argument list or another letter does not fit
    /// the form: nothing that may follow a name begins like that.
    std::optional<std::string> takeName() {
        skipBlanks();
        if (rest_.empty() || !isLetter(rest_.front())) return std::nullopt;
        std::size_t length = 0;
        while (length < rest_.size() && isNameCharacter(rest_[length])) ++length;
        std::string name(rest_.substr(0, length));
        rest_.remove_prefix(length);
        return name;
    }

    bool takePath() {
        while (take("/")) {
            std::optional<std::string> name = takeName();
            if (!name || path_.steps_.size() == kMostSteps) return false;
            path_.steps_.push_back({std::move(*name), {}});
            if (!takePredicates(path_.steps_.back())) return false;
        }
        return !path_.steps_.empty();
    }

    bool takePredicates(Step& step) {
        while (take("[")) {
            if (step.predicates.size() == kMostPredicates) return false;
            if (const std::optional<std::uint32_t> position = takeInteger()) {
                step.predicates.emplace_back(*position);
            } else if (std::optional<Condition> condition = takeJunction(0, false)) {
                step.predicates.emplace_back(std::move(*condition));
            } else {
                return false;
            }
            if (!take("]")) return false;
        }
        return true;
    }

    /// ")[n]" behind a path in parentheses.
    bool takePosition() {
        if (!take(")") || !take("[")) return false;
        const std::optional<std::uint32_t> position = takeInteger();
        if (!position) return false;
        path_.position_ = *position;
        return take("]");
    }

    /// A position: at least 1, few enough digits, and not the beginning of a longer number.
    std::optional<std::uint32_t> takeInteger() {
        skipBlanks();
        std::size_t length = 0;
        std::uint32_t value = 0;
        while (length < rest_.size() && length < 9 && isDigit(rest_[length])) {
            value = value * 10 + static_cast<std::uint32_t>(rest_[length++] - '0');
        }
        if (value == 0 || (length < rest_.size() && (isDigit(rest_[length]) || rest_[length] == '.'))) {
            return std::nullopt;
        }
        rest_.remove_prefix(length);
        return value;
    }

    std::optional<Condition> takeJunction(int depth, bool isConjunction) {
        if (depth > kDeepestCondition) return std::nullopt;
        Condition junction;
        junction.kind = isConjunction ? Condition::Kind::conjunction : Condition::Kind::disjunction;
        do {
            std::optional<Condition> operand = isConjunction ? takeOperand(depth) : takeJunction(depth, true);
            if (!operand) return std::nullopt;
            junction.operands.push_back(std::move(*operand));
        } while (takeWord(isConjunction ? "and" : "or"));
        if (junction.operands.size() > 1) return junction;
        Condition only = std::move(junction.operands.front());
        return only;
    }

    bool takeWord(std::string_view word) {
        skipBlanks();
        if (!rest_.starts_with(word)) return false;
        if (rest_.size() > word.size() && isNameCharacter(rest_[word.size()])) return false;
        rest_.remove_prefix(word.size());
        return true;
    }

    std::optional<Condition> takeOperand(int depth) {
        if (take("(")) {
            std::optional<Condition> inner = takeJunction(depth + 1, false);
            return inner && take(")") ? std::move(inner) : std::nullopt;
        }
        Condition condition;
        const bool taken =
            take("@") ? takeOperator(condition.comparison) : takeFunction(condition.comparison);
        return taken ? std::optional(std::move(condition)) : std::nullopt;
    }

    bool takeFunction(Comparison& comparison) {
        if (takeWord("contains")) {
            comparison.relation = Relation::contains;
        } else if (takeWord("starts-with")) {
            comparison.relation = Relation::startsWith;
        } else {
            return false;
        }
        return take("(") && take("@") && takeAttribute(comparison) && take(",") && takeText(comparison) &&
               take(")");
    }

    bool takeAttribute(Comparison& comparison) {
        std::optional<std::string> name = takeName();
        if (name) comparison.attribute = std::move(*name);
        return name.has_value();
    }

    bool takeOperator(Comparison& comparison) {
        if (!takeAttribute(comparison)) return false;
        static constexpr std::pair<std::string_view, Relation> operators[] = {
            {"=", Relation::equal}, {"!=", Relation::notEqual},       {"<=", Relation::lessOrEqual},
            {"<", Relation::less},  {">=", Relation::greaterOrEqual}, {">", Relation::greater}};
        for (const auto& [token, relation] : operators) {
            if (!take(token)) continue;
            comparison.relation = relation;
            const bool mayBeText = relation == Relation::equal || relation == Relation::notEqual;
            return (mayBeText && takeText(comparison)) || takeNumber(comparison);
        }
        return true;
    }

    bool takeText(Comparison& comparison) {
        skipBlanks();
        if (rest_.empty() || (rest_.front() != '\'' && rest_.front() != '"')) return false;
        const std::size_t end = rest_.find(rest_.front(), 1);
        if (end == std::string_view::npos) return false;
        comparison.constant = std::string(rest_.substr(1, end - 1));
        rest_.remove_prefix(end + 1);
        return true;
    }

    /// A whole number of few digits, whose value is beyond doubt.
    bool takeNumber(Comparison& comparison) {
        skipBlanks();
        std::size_t length = 0;
        double value = 0;
        while (length < rest_.size() && isDigit(rest_[length])) value = value * 10 + (rest_[length++] - '0');
        const bool isWhole = length > 0 && length < 10;
        const bool goesOn = length < rest_.size() && (isNameCharacter(rest_[length]) || rest_[length] == '*');
        if (!isWhole || goesOn) return false;
        comparison.constant = value;
        rest_.remove_prefix(length);
        return true;
    }

    std::string_view rest_;
    LocationPath path_;
};

std::optional<LocationPath> LocationPath::parse(std::string_view expression) {
    return LocationPathParser(expression).parse();
}

}  // namespace qvct
