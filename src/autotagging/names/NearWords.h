#pragma once

#include <array>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Finds the word that a shortened or misspelled one stands for: "harmnica", "strng", "triang", "vibrophone".
///
/// Names that had to fit into twelve letters drop vowels, or break off; people who type leave out a letter,
/// double one or take another. All begin with the same letter. A word that is near to words for different
/// things stands for none.
/// @cost  O(words that begin with the same letter).
class NearWords {
  public:
    /// Words of other letters than a to z, and those shorter than five, are passed over.
    void add(std::string_view word, std::string_view label);
    /// The word that is nearest to this one; null when there is none, or words of several labels are.
    const std::string* wordFor(std::string_view folded) const;

  private:
    struct Known {
        std::string word;
        std::string label;
    };

    std::array<std::vector<Known>, 26> words_;  // by their first letter
};

}  // namespace qvct
