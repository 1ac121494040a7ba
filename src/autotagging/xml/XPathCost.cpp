#include "autotagging/xml/XPathCost.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <array>
#include <string_view>
#include <vector>

namespace qvct {
namespace {

bool isNameCharacter(char c) {
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '_' ||
           c == '-' || c == '.' || static_cast<unsigned char>(c) >= 0x80;
}

/// A name or number is one token, and so is every other sign or two-character operator.
std::vector<std::string_view> tokensOf(std::string_view text) {
    constexpr std::array<std::string_view, 6> pairs = {"//", "::", "..", "!=", "<=", ">="};
    std::vector<std::string_view> tokens;
    for (std::size_t at = 0; at < text.size();) {
        std::size_t length = 1;
        const bool isPair = std::find(pairs.begin(), pairs.end(), text.substr(at, 2)) != pairs.end();
        if (text[at] == '"' || text[at] == '\'') {
            length = std::min(text.find(text[at], at + 1), text.size() - 1) + 1 - at;
        } else if (isPair) {
            length = 2;
        } else if (isNameCharacter(text[at]) && text[at] != '.' && text[at] != '-') {
            while (at + length < text.size() && isNameCharacter(text[at + length])) ++length;
        }
        if (!isAsciiBlank(text[at])) tokens.push_back(text.substr(at, length));
        at += length;
    }
    return tokens;
}

template <std::size_t size>
bool isOneOf(std::string_view token, const std::array<std::string_view, size>& all) {
    return std::find(all.begin(), all.end(), token) != all.end();
}

/// Follows the grammar of operands; all operators are treated alike.
class Scan {
  public:
    explicit Scan(std::string_view expression) : tokens_(tokensOf(expression)) {}

    XPathCost cost() {
        while (at_ < tokens_.size()) {
            takeExpression();
            ++at_;  // a bracket that closes nothing
        }
        return cost_;
    }

  private:
    struct Operand {
        bool isSet = false;   // may be a node set
        bool isMany = false;  // may have more than one node
        bool isText = false;  // its nodes' texts may be more than attribute values
    };

    std::string_view token(std::size_t ahead = 0) const {
        return at_ + ahead < tokens_.size() ? tokens_[at_ + ahead] : std::string_view{};
    }

    bool take(std::string_view wanted) {
        if (token() != wanted) return false;
        ++at_;
        return true;
    }

    bool isAtEnd() const { return token().empty() || token() == ")" || token() == "]" || token() == ","; }

    Operand takeExpression() {
        Operand left = takeOperand();
        while (!isAtEnd()) {
            const std::string_view sign = token();
            ++at_;
            const Operand right = takeOperand();
            if (sign == "|") {
                cost_.isJoin = true;
                left = {true, true, left.isText || right.isText};
            } else {
                const bool isJunction = sign == "and" || sign == "or";
                cost_.isJoin |= !isJunction && left.isMany && right.isMany;
                cost_.readsText |= !isJunction && (left.isText || right.isText);
                left = right.isSet ? right : Operand{};  // it may belong to the next operator
            }
        }
        return left;
    }

    /// Up to the next operator. After a whole step "*" and names are operators.
    Operand takeOperand() {
        bool isNegative = false;
        while (take("-")) isNegative = true;
        Operand operand;
        const std::string_view first = token();
        if (first.empty() || first[0] == '\'' || first[0] == '"' || (first[0] >= '0' && first[0] <= '9')) {
            ++at_;
            return operand;
        }
        if (take("(")) {
            operand = takeExpression();
            take(")");
            takeSteps(operand, false);
        } else if (isFunction()) {
            operand = takeFunction();
            takeSteps(operand, false);
        } else {
            operand = {true, false, true};
            takeSteps(operand, true);
        }
        cost_.readsText |= isNegative && operand.isText;
        return operand;
    }

    bool isFunction() const {
        constexpr std::array<std::string_view, 4> nodeTests = {"node", "text", "comment",
                                                               "processing-instruction"};
        return token(1) == "(" && isNameCharacter(token()[0]) && !isOneOf(token(), nodeTests);
    }

    Operand takeFunction() {
        constexpr std::array<std::string_view, 11> readNoText = {
            "last", "position", "count",   "local-name", "namespace-uri", "name",
            "true", "false",    "boolean", "not",        "lang"};
        const std::string_view name = token();
        const bool reads = !isOneOf(name, readNoText);
        at_ += 2;
        if (reads && token() == ")") takeText({true, false, true});  // of the context node
        while (!token().empty() && token() != ")") {
            const Operand argument = takeExpression();
            if (reads && argument.isSet) takeText(argument);
            if (!take(",")) break;
        }
        take(")");
        if (name != "id") return {};
        cost_.isJoin = cost_.readsIds = true;
        return {true, true, true};
    }

    void takeText(const Operand& operand) {
        cost_.readsText |= operand.isText;
        ++cost_.texts;
    }

    /// Steps and predicates. In a path that stands by itself, the first step starts at a single node.
    void takeSteps(Operand& operand, bool isFirst) {
        bool isStepDue = isFirst;
        while (true) {
            if (take("[")) {
                takeExpression();
                take("]");
            } else if (token() == "/" || token() == "//") {
                if (token() == "//") takeAxis(operand, isFirst);
                operand.isSet = operand.isText = true;
                operand.isMany = true;
                isFirst = isFirst && isStepDue && token() == "/";  // from the root
                isStepDue = true;
                ++at_;
            } else if (isStepDue && beginsStep(token())) {
                takeStep(operand, isFirst);
                isFirst = isStepDue = false;
            } else {
                return;
            }
        }
    }

    static bool beginsStep(std::string_view token) {
        return token == "@" || token == "*" ||
               (!token.empty() && isNameCharacter(token[0]) && token[0] != '-');
    }

    void takeAxis(Operand& operand, bool isFirst) {
        operand.isMany = true;
        cost_.isJoin |= !isFirst;
    }

    void takeStep(Operand& operand, bool isFirst) {
        constexpr std::array<std::string_view, 3> simpleAxes = {"child", "attribute", "self"};
        std::string_view axis = "child";
        if (take("@")) {
            axis = "attribute";
        } else if (token(1) == "::") {
            axis = token();
            at_ += 2;
        } else if (token() == "..") {
            axis = "parent";
        } else if (token() == ".") {
            axis = "self";
        }
        if (!isOneOf(axis, simpleAxes)) takeAxis(operand, isFirst && axis != "namespace");
        const bool isAttribute = axis == "attribute";
        operand.isText = !isAttribute;
        operand.isMany |= axis == "child" || (isAttribute && token() == "*");
        takeTest();
    }

    void takeTest() {
        ++at_;
        if (take(":")) ++at_;
        if (!take("(")) return;  // of a node type
        while (!token().empty() && !take(")")) ++at_;
    }

    std::vector<std::string_view> tokens_;
    std::size_t at_ = 0;
    XPathCost cost_;
};

}  // namespace

XPathCost costOfXPath(std::string_view expression) {
    return Scan(expression).cost();
}

}  // namespace qvct
