#pragma once

#include "autotagging/keywords/QVCTKeywordExtractor.h"

#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::test {

/// Paths as sound libraries have them, by the million: words of the vocabulary in any case, whole or inside
/// other words, between the separators that people use; every fourth path holds words of other scripts, and
/// some of these hold characters that match ASCII letters when case is ignored.
class PathGenerator {
  public:
    explicit PathGenerator(const QVCTKeywordExtractor& extractor, unsigned seed = 1) : random_(seed) {
        for (const auto& entry : extractor.keywordMappingDictionary()) vocabulary_.push_back(entry.key);
        for (const std::string& label : extractor.keywordsSet()) vocabulary_.push_back(label);
    }

    std::string next() {
        const bool isLatin = pick(4) != 0;
        std::string path = "file:///Users/producer/Music/Sound Library";
        const std::size_t folders = 1 + pick(3);
        for (std::size_t i = 0; i < folders; ++i) path += "/" + phrase(1 + pick(2), isLatin);
        return path + "/" + phrase(1 + pick(4), isLatin) + extensions_[pick(extensions_.size())];
    }

  private:
    std::size_t pick(std::size_t count) {
        return std::uniform_int_distribution<std::size_t>(0, count - 1)(random_);
    }

    std::string phrase(std::size_t words, bool isLatin) {
        std::string text;
        for (std::size_t i = 0; i < words; ++i) {
            if (i > 0) text += separators_[pick(separators_.size())];
            text += word(isLatin);
        }
        return text;
    }

    std::string word(bool isLatin) {
        if (!isLatin && pick(2) == 0) return foreign_[pick(foreign_.size())];
        if (pick(2) == 0) return neutral_[pick(neutral_.size())];
        std::string text = vocabulary_[pick(vocabulary_.size())];
        const std::size_t way = pick(8);
        for (char& c : text) {
            if (way == 0 && c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
            if (way == 1 && c >= 'A' && c <= 'Z') c = static_cast<char>(c - 'A' + 'a');
        }
        if (way == 2) text += "X";
        if (way == 3) text = neutral_[pick(neutral_.size())] + text;
        if (way == 4 && !isLatin) text = replacedLetter(text);
        return text;
    }

    /// One letter as a look-alike that case folding makes equal to it.
    static std::string replacedLetter(std::string text) {
        for (std::size_t i = 0; i < text.size(); ++i) {
            if (text[i] == 's') return text.replace(i, 1, "\xc5\xbf");
            if (text[i] == 'k' || text[i] == 'K') return text.replace(i, 1, "\xe2\x84\xaa");
            if (text.compare(i, 2, "fl") == 0) return text.replace(i, 2, "\xef\xac\x82");
        }
        return text + "\xcc\x81";  // a combining accent behind the last letter
    }

    std::mt19937 random_;
    std::vector<std::string> vocabulary_;
    std::vector<std::string> neutral_ = {"Take", "01",    "120bpm", "final", "v2",
                                         "Am",   "Dusty", "room",   "close", "loop_03"};
    std::vector<std::string> foreign_ = {"\xe9\x9f\xb3\xe6\xa5\xbd",
                                         "\xd0\x91\xd0\xb0\xd1\x81",
                                         "\xce\x9c\xcf\x80\xce\xac\xcf\x83\xce\xbf",
                                         "Stra\xc3\x9f\x65",
                                         "Caf\xc3\xa9",
                                         "\xf0\x9f\xa5\x81",
                                         "\xe3\x83\x89\xe3\x83\xa9\xe3\x83\xa0",
                                         "\xd8\xb7\xd8\xa8\xd9\x84",
                                         "\xef\xac\x81ll",
                                         "e\xcc\x81tude"};
    std::vector<std::string> separators_ = {" ", "_", "-", ".", " - ", "", "\xe2\x80\x8d", "("};
    std::vector<std::string> extensions_ = {".wav", ".aif", ".caf", ".patch", ".cst"};
};

}  // namespace qvct::test
