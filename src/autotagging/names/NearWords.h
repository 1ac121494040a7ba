#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace qvct {

/// Finds the word that a shortened, misspelled or compound one stands for: "harmnica", "strng", "triang",
/// "vibrophone", "hoarseorgan".
///
/// Names that had to fit into twelve letters drop vowels, or break off; people who type leave out a letter,
/// double one or take another. All begin with the same letter. A word that is near to words for different
/// things stands for none.
/// @cost  O(words that begin with the same letter), of which few are looked at twice.
class NearWords {
  public:
    /// Words of other letters than a to z are passed over, and those that are too short to be told.
    void add(std::string_view word, std::string_view label);
    /// The word that is nearest to this one; null when there is none, or words of several labels are.
    const std::string* wordFor(std::string_view folded) const;
    /// The longest word that this one ends with, also in the plural, behind at least so many letters; null
    /// when there is none.
    const std::string* wordAtEndOf(std::string_view folded, std::size_t lettersBefore) const;

  private:
    struct Known {
        std::string word;
        std::string label;
        std::uint32_t letters;  // one bit for each that it has
    };

    const std::string* ending(std::string_view folded, std::size_t lettersBefore) const;

    std::array<std::vector<Known>, 26> words_;                           // by their first letter
    std::unordered_map<std::string, std::vector<std::string>> endings_;  // by their last four letters
};

}  // namespace qvct
