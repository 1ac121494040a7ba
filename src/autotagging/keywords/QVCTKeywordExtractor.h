#pragma once

#include "platform/base/CountedSet.h"
#include "platform/base/Export.h"
#include "platform/data/PropertyList.h"
#include "platform/text/RegularExpression.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

namespace qvct {

class LiteralTrie;

/// Finds tag labels in a text: the words of a keyword mapping and every label of a taxonomy, as whole words.
///
/// A mapping is a dictionary from a keyword (a word, or "regex:" and an expression) to a label or an array of
/// labels; a label may end in a level, "Bright / Dark (0.0)".
///
/// The result is that of one case-insensitive expression per keyword. To get there faster, one pass looks at
/// every place where a word begins or ends for the keywords that start there; a plain word is decided on the
/// spot, by what stands behind it, and any other by its expression. Expressions without a text that must
/// occur are always run.
///
/// Use one extractor from one thread at a time: it fills its cache of expressions as it goes.
class QVCT_API QVCTKeywordExtractor {
  public:
    /// From the resource folder, else compiled in.
    static PropertyList::Dictionary defaultKeywordMapping();
    /// A new extractor with the default mapping and taxonomy.
    static std::shared_ptr<QVCTKeywordExtractor> defaultKeywordExtractor();
    /// Null, and an error, when the file is not a readable dictionary.
    static std::shared_ptr<QVCTKeywordExtractor> keywordExtractorWithKeywordMappingDictionaryURL(
        const std::optional<URL>& url, Error* error = nullptr);
    /// Without a mapping the default one; without a taxonomy the default one.
    static std::shared_ptr<QVCTKeywordExtractor> initWithKeywordMappingDictionary(
        std::optional<PropertyList::Dictionary> mapping, std::shared_ptr<TGRTTaxonomy> taxonomy = nullptr);
    ~QVCTKeywordExtractor();

    const PropertyList::Dictionary& keywordMappingDictionary() const { return mapping_; }
    /// Every label that the mapping yields and every label of the taxonomy.
    const std::vector<std::string>& keywordsSet() const { return keywordsSet_; }
    const std::shared_ptr<TGRTTaxonomy>& taxonomy() const { return taxonomy_; }

    /// Nothing, and a line in the log, when the keyword is no valid expression.
    static std::optional<RegularExpression> regexForKeyword(std::string_view keyword);
    /// The same, compiled once. Null for a keyword that does not compile, which is tried anew each time.
    RegularExpression* cachedRegexForKeyword(std::string_view keyword);

    /// A keyword that was found, where it first stands, and what it yields.
    struct Occurrence {
        std::uint32_t offset;  ///< In bytes.
        std::uint32_t end;
        std::vector<std::string_view> labels;  ///< As long as the extractor lives.
    };
    /// The keywords found, in the order in which they were given.
    /// @cost  As below, and a search for each one.
    std::vector<Occurrence> occurrencesInString(std::string_view text);

    /// The labels found, with how often each was found, and then their parents' labels.
    /// @cost  O(text) plus a microsecond or so for each keyword that an expression has to decide.
    CountedSet extractKeywordsFromString(std::string_view text);

  private:
    /// A keyword, and what an occurrence yields: indices of results, as often as they count.
    struct Keyword {
        std::string text;
        std::vector<std::uint32_t> results;
    };
    /// A text to scan for, and the keywords that need it.
    struct Literal {
        std::string text;
        std::vector<std::uint32_t> plain;
        std::vector<std::uint32_t> expressions;
    };
    /// What is known of a keyword while one text is looked at.
    enum class Mark : std::uint8_t { unseen, candidate, found };

    QVCTKeywordExtractor(PropertyList::Dictionary mapping, std::shared_ptr<TGRTTaxonomy> taxonomy);

    void setupKeywordMapping(const PropertyList::Dictionary& mapping);
    void setupWithTaxonomy(const TGRTTaxonomy& taxonomy);
    void addToKeywordsSet(const std::string& label);
    void compileKeywords();
    void compileTrie();
    std::uint32_t resultIndex(const std::string& text);
    void findParents();

    std::vector<std::uint32_t> matchingKeywords(std::string_view text);
    std::optional<std::pair<std::uint32_t, std::uint32_t>> placeOf(const std::string& keyword,
                                                                   std::string_view text);
    void scanForCandidates(std::string_view text);
    void scanFolded(std::string_view text);
    void mark(std::uint32_t keyword, Mark mark);
    CountedSet resultsOf(const std::vector<std::uint32_t>& keywords);

    PropertyList::Dictionary mapping_;
    std::shared_ptr<TGRTTaxonomy> taxonomy_;
    std::vector<std::string> keywordsSet_;
    std::unordered_map<std::string, std::unique_ptr<RegularExpression>> regexCacheDictionary_;

    std::vector<Keyword> keywords_;
    std::vector<Literal> literals_;
    std::unique_ptr<LiteralTrie> trie_;
    std::vector<std::uint32_t> alwaysRun_;
    bool hasNonAsciiLiterals_ = false;
    std::vector<Mark> marks_;
    std::vector<std::uint32_t> touched_;

    std::vector<std::string> results_;
    std::unordered_map<std::string, std::uint32_t> resultIndices_;
    /// For each result the index of its tag's parent's label, or -1, as of a revision of the taxonomy.
    std::vector<std::int64_t> parentOf_;
    std::optional<std::uint64_t> parentsRevision_;
};

}  // namespace qvct
