#pragma once

#include "autotagging/names/Thesaurus.h"
#include "contentdb/IndexedItem.h"
#include "platform/base/Export.h"
#include "platform/text/RegularExpression.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace qvct::contentdb {

/// A field of an item that a query can name.
struct Field {
    /// Which of an item's texts, sets or numbers.
    enum class Kind { name, path, type, pack, tag, key, level, number };
    Kind kind = Kind::name;
    /// The category (folded; empty for any) of `tag`, the label of `level`, the key (bare) of `number`.
    std::string of;

    bool operator==(const Field&) const = default;
};

/// The item has these words in a row in its name, title, path or a label; in folded form.
struct WordsMatch {
    std::vector<std::string> words;
    bool lastMayContinue = true;
    /// For a text without letters and digits: it occurs as it is.
    std::string literal;
};
/// The item has the tag or one below it; folded.
struct TagMatch {
    std::string label;
    std::string category;
};
/// One of the item's numbers in the field lies in the range. The field of a tag's level is
/// `levelField(label)`.
struct NumberMatch {
    std::string field;
    double low;
    double high;
    bool includesLow = true;
    bool includesHigh = true;

    /// Whether the value lies in the range.
    bool contains(double value) const {
        return (includesLow ? value >= low : value > low) && (includesHigh ? value <= high : value < high);
    }
};
/// The item is of that FileType.
struct TypeMatch {
    std::int64_t type;
};
/// The field is (a pack), or contains (a name or path), the text; folded.
struct TextMatch {
    Field field;
    std::string text;
};
/// The expression occurs in one of the field's texts, in any case.
struct ExpressionMatch {
    Field field;
    std::shared_ptr<RegularExpression> expression;
};

/// A condition on an item: a tree of all, any and not over matches.
struct Condition;
/// Every part holds; true when there are no parts.
struct AllOf {
    std::vector<Condition> parts;
};
/// At least one part holds.
struct AnyOf {
    std::vector<Condition> parts;
};
/// No part holds.
struct NoneOf {
    std::vector<Condition> parts;
};
/// One node of the tree.
struct Condition {
    std::variant<AllOf, AnyOf, NoneOf, WordsMatch, TagMatch, NumberMatch, TypeMatch, TextMatch,
                 ExpressionMatch>
        is;
};

/// What a query sorts by.
struct SortKey {
    Field field;
    bool isDescending = false;
};

/// At most so many items sound like something: the nearest of those that meet the query's other conditions.
inline constexpr std::size_t kMostAlike = 100;

/// A sound that the found items are to sound like.
struct SoundToMeet {
    /// An item of the database, or any other file, as it was written.
    std::string file;
    /// As in `IndexedItem::likeness`. When it is empty, the database looks it up, or listens to the file.
    std::string likeness = {};
};

/// A parsed query. Belongs to one thread at a time, because of its regular expressions.
struct Query {
    Condition condition;
    /// Empty for the order in which items came into the database.
    std::vector<SortKey> order;
    /// Then only the `kMostAlike` nearest items are found, nearest first where `order` does not say
    /// otherwise.
    std::optional<SoundToMeet> like = {};
};

/// The names that are fields besides the built-in ones.
struct Vocabulary {
    /// Identifiers of tag categories: "Genres" can be named as `genres`, `genre`, `gen`.
    std::vector<std::string> categories;
    /// Keys of numbers: "BeatCount".
    std::vector<std::string> numbers;
    /// The tag that people mean by a word: Kick by "bd". None where it is empty.
    std::function<std::optional<MeantTag>(std::string_view word)> tagMeant = {};
};

/// What is wrong with a query, and where.
struct QueryError {
    std::string message;
    std::size_t position = 0;  ///< byte offset in the query
    std::size_t length = 0;    ///< bytes that it concerns; 0 at the end
};

/// Reads a query as docs/query.md describes it. An empty one matches everything.
/// @cost  O(length), without recursion.
QVCT_API std::optional<Query> parseQuery(std::string_view text, const Vocabulary& vocabulary,
                                         QueryError* error);

/// Evaluates a query in memory: whether it finds the item, of which only a database knows whether it is among
/// those that sound most alike: here it needs to have been heard. Failed items are never found. False, and an
/// error, when a regular expression of the query takes too long on the item.
QVCT_API bool matches(const Query& query, const IndexedItem& item, Error* error = nullptr);

/// Whether `a` comes before `b` in the query's order; items without the field last. Neither of two equal
/// items comes before the other: a stable sort keeps the order of the database.
QVCT_API bool comesBefore(const Query& query, const IndexedItem& a, const IndexedItem& b);

}  // namespace qvct::contentdb
