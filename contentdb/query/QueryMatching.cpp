#include "contentdb/query/QueryMatching.h"

#include "contentdb/query/QueryFields.h"
#include "contentdb/terms/Terms.h"
#include "contentdb/terms/Words.h"
#include "platform/text/Text.h"

#include <algorithm>

namespace qvct::contentdb {
namespace {

bool beginsAt(const std::vector<std::string>& words, std::size_t at, const WordsMatch& match) {
    for (std::size_t i = 0; i < match.words.size(); ++i) {
        const bool isLast = i + 1 == match.words.size();
        const bool isSame = isLast && match.lastMayContinue ? words[at + i].starts_with(match.words[i])
                                                            : words[at + i] == match.words[i];
        if (!isSame) return false;
    }
    return true;
}

bool occursInWords(const WordsMatch& match, std::string_view text) {
    const std::vector<std::string> words = wordsOf(text);
    for (std::size_t at = 0; at + match.words.size() <= words.size(); ++at) {
        if (beginsAt(words, at, match)) return true;
    }
    return false;
}

/// Whether one item meets a match; there is one overload for each kind of match.
class Matching {
  public:
    Matching(const IndexedItem& item, Error& fault) : item_(item), fault_(fault) {}

    bool operator()(const Condition& condition) const {
        return !fault_.isSet() && std::visit(*this, condition.is);
    }
    bool operator()(const AllOf& all) const { return std::all_of(all.parts.begin(), all.parts.end(), *this); }
    bool operator()(const AnyOf& any) const { return std::any_of(any.parts.begin(), any.parts.end(), *this); }
    bool operator()(const NoneOf& none) const {
        return std::none_of(none.parts.begin(), none.parts.end(), *this);
    }

    bool operator()(const WordsMatch& match) const {
        const std::vector<std::string_view> texts = textsOf(item_);
        return std::any_of(texts.begin(), texts.end(), [&match](std::string_view text) {
            return match.words.empty() ? folded(text).find(match.literal) != std::string::npos
                                       : occursInWords(match, text);
        });
    }
    bool operator()(const TagMatch& match) const {
        const std::vector<std::string> labels = textsInField(item_, {Field::Kind::tag, match.category});
        return std::any_of(labels.begin(), labels.end(),
                           [&match](const std::string& label) { return folded(label) == match.label; });
    }
    bool operator()(const NumberMatch& match) const {
        const auto numbers = numbersOf(item_);
        return std::any_of(numbers.begin(), numbers.end(), [&match](const auto& number) {
            return number.first == match.field && match.contains(number.second);
        });
    }
    bool operator()(const TypeMatch& match) const { return item_.fileType == match.type; }
    bool operator()(const TextMatch& match) const {
        const std::vector<std::string> texts = textsInField(item_, match.field);
        const bool isWhole = match.field.kind == Field::Kind::pack;
        return std::any_of(texts.begin(), texts.end(), [&](const std::string& text) {
            return isWhole ? folded(text) == match.text : folded(text).find(match.text) != std::string::npos;
        });
    }
    bool operator()(const ExpressionMatch& match) const {
        const std::vector<std::string> texts = textsInField(item_, match.field);
        return std::any_of(texts.begin(), texts.end(), [&](const std::string& text) {
            return match.expression->occursIn(utf16FromUtf8(text), &fault_);
        });
    }

  private:
    const IndexedItem& item_;
    Error& fault_;  // an expression that was given up: then the answer is none
};

}  // namespace

bool meets(const Condition& condition, const IndexedItem& item, Error& fault) {
    return Matching(item, fault)(condition);
}

}  // namespace qvct::contentdb
