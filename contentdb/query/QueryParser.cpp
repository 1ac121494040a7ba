#include "contentdb/query/QueryParser.h"

#include "contentdb/query/QueryFields.h"
#include "contentdb/terms/Terms.h"
#include "contentdb/terms/Words.h"
#include "formats/QVContentTaggingTypes.h"
#include "platform/text/Text.h"
#include "taxonomy/TaggingTypes.h"

#include <charconv>
#include <cmath>
#include <limits>
#include <utility>

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

/// A stretch of the query: its text without quotes, and where it stands.
struct Piece {
    std::string text;
    std::size_t start = 0;
    std::size_t end = 0;
    bool isQuoted = false;
};

constexpr double kInfinity = std::numeric_limits<double>::infinity();

class Parser {
  public:
    Parser(std::string_view text, const Vocabulary& vocabulary) : text_(text), vocabulary_(vocabulary) {}

    Query parse() {
        AnyOf alternatives;
        AllOf terms;
        for (skipBlanks(); at_ < text_.size(); skipBlanks()) {
            if (!accept(",")) {
                term(terms);
            } else if (!terms.parts.empty()) {
                alternatives.parts.push_back({std::exchange(terms, {})});
            }
        }
        if (!terms.parts.empty() || alternatives.parts.empty())
            alternatives.parts.push_back({std::move(terms)});
        query_.condition = alternatives.parts.size() == 1 ? std::move(alternatives.parts[0])
                                                          : Condition{std::move(alternatives)};
        return std::move(query_);
    }

  private:
    [[noreturn]] static void fail(std::size_t start, std::size_t end, std::string message) {
        throw QueryFault{{std::move(message), start, end - start}};
    }

    bool isAtEndOfTerm() const {
        return at_ >= text_.size() || isAsciiBlank(text_[at_]) || text_[at_] == ',';
    }

    void skipBlanks() {
        while (at_ < text_.size() && isAsciiBlank(text_[at_])) ++at_;
    }

    bool accept(std::string_view token) {
        if (text_.substr(at_, token.size()) != token) return false;
        at_ += token.size();
        return true;
    }

    /// Reads up to a blank, a comma or one of `stops`; or a text in quotes, in which \" and \\ stand for "
    /// and \.
    Piece piece(std::string_view stops) {
        Piece result{{}, at_, at_, false};
        if (accept("\"")) {
            result.isQuoted = true;
            while (at_ < text_.size() && text_[at_] != '"') {
                const std::string_view two = text_.substr(at_, 2);
                if (two == "\\\"" || two == "\\\\") ++at_;
                result.text += text_[at_++];
            }
            if (!accept("\"")) fail(result.start, text_.size(), "the quote is not closed");
        } else {
            while (!isAtEndOfTerm() && text_[at_] != '"' && stops.find(text_[at_]) == std::string_view::npos)
                result.text += text_[at_++];
        }
        result.end = at_;
        return result;
    }

    void term(AllOf& terms) {
        const std::size_t start = at_;
        const bool isNegated = text_[at_] == '-' && at_ + 1 < text_.size() && !isAsciiBlank(text_[at_ + 1]) &&
                               text_[at_ + 1] != ',';
        if (isNegated) ++at_;
        if (acceptLike()) {
            if (isNegated) fail(start, at_, "likeness cannot be negated");
            return;
        }
        if (const auto key = sortKey()) {
            if (isNegated) fail(start, at_, "an order cannot be negated");
            query_.order.push_back(*key);
            return;
        }
        std::optional<Field> field;
        AnyOf any{{factor(field)}};
        // "kick,snare", "genre:House,Techno": a comma that no blank follows adds an alternative word or
        // value.
        while (at_ + 1 < text_.size() && text_[at_] == ',' && !isAsciiBlank(text_[at_ + 1]) &&
               text_[at_ + 1] != ',') {
            ++at_;
            any.parts.push_back(factor(field));
        }
        Condition condition = oneOf(std::move(any));
        if (isNegated) condition = {NoneOf{{std::move(condition)}}};
        terms.parts.push_back(std::move(condition));
    }

    /// "like:kick.wav"; as a sorting it is for the whole query.
    bool acceptLike() {
        const std::size_t start = at_;
        const Piece word = piece(":<>=");
        if (word.isQuoted || bareName(word.text) != "like" || !isAtOperator()) {
            at_ = start;
            return false;
        }
        if (!accept(":") || isAtOperator())
            fail(start, at_ + 1, "\"like\" takes the path of a sound: like:kick.wav");
        const Piece file = text(start, "");
        const bool isAnother = at_ + 1 < text_.size() && text_[at_] == ',' && !isAsciiBlank(text_[at_ + 1]);
        if (query_.like || isAnother) fail(start, at_, "one query can be like one sound only");
        query_.like = SoundToMeet{file.text};
        return true;
    }

    /// "bpm+" or "name-", standing alone.
    std::optional<SortKey> sortKey() {
        const std::size_t start = at_;
        const Piece word = piece(":<>=");
        const bool isKey = !word.isQuoted && word.text.size() > 1 && isAtEndOfTerm() &&
                           (word.text.back() == '+' || word.text.back() == '-');
        if (!isKey) {
            at_ = start;
            return std::nullopt;
        }
        std::string reason;
        const auto field =
            fieldNamed(std::string_view(word.text).substr(0, word.text.size() - 1), vocabulary_, reason);
        if (!field) fail(word.start, word.end, reason);
        if (field->kind == Field::Kind::level) fail(word.start, word.end, "levels are no order");
        return SortKey{*field, word.text.back() == '-'};
    }

    bool isAtOperator() const {
        return at_ < text_.size() && std::string_view(":<>=").find(text_[at_]) != std::string_view::npos;
    }

    /// One word, or one field with its value; or another value of the field before it.
    Condition factor(std::optional<Field>& field) {
        const std::size_t start = at_;
        if (field && field->kind == Field::Kind::level) return value(*field, start);
        const Piece first = piece(":<>=");
        if (isAtOperator()) {
            std::string reason;
            field = fieldNamed(first.text, vocabulary_, reason);
            if (!field) fail(first.start, first.end, reason);
            if (accept("::")) return expression(*field);
            if (!isNumeric(*field) && text_[at_] != ':')
                fail(at_, at_ + 1, fmt::format("\"{}\" is no number and cannot be compared", first.text));
            accept(":");
            return value(*field, start);
        }
        if (!field) return words(first);
        at_ = start;
        return value(*field, start);
    }

    /// Words, or what people mean by them; in quotes just the words.
    Condition words(const Piece& word) const {
        WordsMatch match{wordsOf(word.text), !word.isQuoted, {}};
        if (match.words.empty()) match.literal = folded(word.text);
        AnyOf any{{Condition{std::move(match)}}};
        if (!word.isQuoted) addMeant(word.text, {}, any);
        return oneOf(std::move(any));
    }

    Condition tag(const Piece& word, const std::string& category) const {
        AnyOf any{{Condition{TagMatch{folded(word.text), category}}}};
        if (!word.isQuoted) addMeant(word.text, category, any);
        return oneOf(std::move(any));
    }

    void addMeant(const std::string& text, const std::string& category, AnyOf& any) const {
        const auto meant = vocabulary_.tagMeant ? vocabulary_.tagMeant(text) : std::nullopt;
        if (!meant || folded(meant->label) == folded(text)) return;
        Condition tag{TagMatch{folded(meant->label), category}};
        if (!meant->level) return any.parts.push_back(std::move(tag));
        // On the side of the pole that the word names.
        constexpr double kMiddle = 0.5;
        NumberMatch side{levelField(meant->label), -kInfinity, kInfinity, true, true};
        (*meant->level < kMiddle ? side.high : side.low) = kMiddle;
        any.parts.push_back({AllOf{{std::move(tag), Condition{std::move(side)}}}});
    }

    static Condition oneOf(AnyOf any) {
        return any.parts.size() == 1 ? std::move(any.parts[0]) : Condition{std::move(any)};
    }

    Condition value(const Field& field, std::size_t start) {
        if (field.kind == Field::Kind::number) return number(field.of, start);
        if (field.kind == Field::Kind::level) {
            const Piece label = text(start, "<>=:");
            accept(":");
            return number(levelField(label.text), start, isAtEndOfTerm());
        }
        const Piece word = text(start, "");
        switch (field.kind) {
            case Field::Kind::tag:
                return tag(word, field.of);
            case Field::Kind::key:
                return key(word);
            case Field::Kind::type:
                return type(word);
            default:
                return {TextMatch{field, folded(word.text)}};
        }
    }

    Piece text(std::size_t start, std::string_view stops) {
        Piece result = piece(stops);
        if (result.text.empty()) fail(start, at_, "a value is missing here");
        return result;
    }

    static Condition key(const Piece& word) {
        AllOf all;
        for (const std::string& label : keyLabels(word.text))
            all.parts.push_back({TagMatch{folded(label), folded(QVCategoryLoopSpecificsIdentifier)}});
        if (all.parts.empty())
            fail(word.start, word.end,
                 fmt::format("\"{}\" is no key; keys are A, C#, Bb, Am, \"A minor\"", word.text));
        return {std::move(all)};
    }

    static Condition type(const Piece& word) {
        if (const auto named = typeNamed(word.text)) return {TypeMatch{*named}};
        std::vector<std::string> names;
        for (std::int64_t code = kFileTypeNone; code <= kFileTypeProject; ++code)
            names.emplace_back(QVContentTaggingTypes::nameForFileType(code));
        fail(word.start, word.end,
             fmt::format("\"{}\" is no type; types are {}", word.text, join(names, ", ")));
    }

    Condition expression(const Field& field) {
        Piece pattern{{}, at_, at_, false};
        if (at_ < text_.size() && text_[at_] == '"') {
            pattern = piece("");
        } else {
            while (at_ < text_.size() && !isAsciiBlank(text_[at_])) pattern.text += text_[at_++];
            pattern.end = at_;
        }
        if (pattern.text.empty()) fail(pattern.start, at_, "an expression is missing here");
        Error error;
        auto compiled =
            RegularExpression::compile(pattern.text, RegularExpression::Case::insensitive, &error);
        if (!compiled) fail(pattern.start, pattern.end, error.message());
        return {ExpressionMatch{field, std::make_shared<RegularExpression>(std::move(*compiled))}};
    }

    /// "120", "118..124", "..90", "140..", ">0.6", "<=4"; "A2..C3" of notes.
    Condition number(std::string field, std::size_t start, bool mayBeMissing = false) {
        NumberMatch match{std::move(field), -kInfinity, kInfinity, true, true};
        const auto bound = [&](const Piece& range, std::size_t from, std::size_t to) {
            const auto note =
                isOfNotes(match.field) ? noteNamed(range.text.substr(from, to - from)) : std::nullopt;
            return note ? *note : parsed(range, from, to);
        };
        if (mayBeMissing) return {match};
        const bool isAbove = accept(">");
        const bool isBelow = !isAbove && accept("<");
        const bool isEqual = accept("=");
        const Piece range = text(start, "");
        const std::size_t dots = range.text.find("..");
        if (isAbove || isBelow) {
            (isAbove ? match.low : match.high) = bound(range, 0, range.text.size());
            (isAbove ? match.includesLow : match.includesHigh) = isEqual;
        } else if (dots == std::string::npos) {
            match.low = match.high = bound(range, 0, range.text.size());
        } else {
            if (dots > 0) match.low = bound(range, 0, dots);
            if (dots + 2 < range.text.size()) match.high = bound(range, dots + 2, range.text.size());
            if (range.text.size() == 2)
                fail(range.start, range.end, "a range needs a number on one side at least");
        }
        if (match.low > match.high) {
            fail(range.start, range.end,
                 fmt::format("the range ends before it begins: {} is more than {}", match.low, match.high));
        }
        return {match};
    }

    static double parsed(const Piece& piece, std::size_t start, std::size_t end) {
        double value = 0;
        const char* const last = piece.text.data() + end;
        const auto [stop, fault] = std::from_chars(piece.text.data() + start, last, value);
        if (fault == std::errc() && stop == last && std::isfinite(value)) return value;
        const std::size_t base = piece.start + (piece.isQuoted ? 1 : 0);
        fail(base + start, base + end,
             fmt::format("\"{}\" is no number", piece.text.substr(start, end - start)));
    }

    std::string_view text_;
    const Vocabulary& vocabulary_;
    std::size_t at_ = 0;
    Query query_;
};

}  // namespace

Query parsedQuery(std::string_view text, const Vocabulary& vocabulary) {
    if (!isValidUtf8(text)) throw QueryFault{{"the query is not UTF-8", 0, text.size()}};
    return Parser(text, vocabulary).parse();
}

}  // namespace qvct::contentdb
