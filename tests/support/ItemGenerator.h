#pragma once

#include "contentdb/IndexedItem.h"
#include "taxonomy/TaggingTypes.h"

#include <array>
#include <cstdint>
#include <random>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct::test {

/// Items as a sound library has them, with facts drawn by a seed: names and folders of the same few hundred
/// words (the first far more often than the last), tags with ancestors and levels, tempo, beats, key, packs.
class ItemGenerator {
  public:
    explicit ItemGenerator(std::uint64_t seed, bool hasOddNames = false)
        : random_(seed), hasOddNames_(hasOddNames) {}

    contentdb::IndexedItem next(std::uint64_t number) {
        contentdb::IndexedItem item;
        item.name = name(number);
        item.path = "/Library/" + word() + " " + word() + "/" + word() + "/" + item.name + ".wav";
        item.payloadHash = "payload " + std::to_string(number);
        item.stamp = {pick(100000), 1, 2, number};
        item.fileType = pick(3) == 0 ? kFileTypeLoop : kFileTypeAudioFile;
        item.previewAvailable = pick(2) == 0;
        addTags(item);
        addValues(item);
        if (pick(4) == 0) item.packs.push_back("Pack " + std::to_string(pick(20)));
        if (pick(8) == 0)
            item.dependencies.push_back({"uuid-" + std::to_string(pick(100)), "/deep/" + word()});
        if (hasOddNames_ && pick(4) == 0) item.title = word() + " " + word();
        return item;
    }

    std::size_t pick(std::size_t count) {
        return std::uniform_int_distribution<std::size_t>(0, count - 1)(random_);
    }
    /// A small number far more often than a large one.
    std::size_t rank(std::size_t count) { return pick(pick(pick(count) + 1) + 1); }

    /// A word of names: real ones first, then made-up ones.
    std::string word() {
        const std::size_t at = rank(400);
        if (at < kWords.size()) return std::string(kWords[at]);
        constexpr std::array<std::string_view, 8> parts = {"ka",  "lo", "mi",  "ren",
                                                           "tos", "ul", "ver", "zan"};
        return std::string(parts[at % 8]) + std::string(parts[at / 8 % 8]) + std::string(parts[at / 64 % 8]);
    }

    struct Tag {
        std::string_view label;
        std::string_view parent;
        std::string_view category;
    };
    const Tag& tag() { return kTags[rank(kTags.size())]; }

  private:
    std::string name(std::uint64_t number) {
        std::string result = word() + "_" + word() + " " + std::to_string(number);
        if (!hasOddNames_ || pick(5) != 0) return result;
        return result + std::string(kOdd[pick(kOdd.size())]);
    }

    void addTags(contentdb::IndexedItem& item) {
        for (std::size_t left = pick(6); left > 0; --left) {
            const Tag& its = tag();
            contentdb::IndexedTagging tagging;
            tagging.label = its.label;
            tagging.category = its.category;
            if (!its.parent.empty()) tagging.ancestors.emplace_back(its.parent);
            if (pick(3) == 0) tagging.level = static_cast<float>(pick(11)) / 10.0F;
            tagging.provenance = static_cast<contentdb::Provenance>(pick(3));
            if (tagging.provenance == contentdb::Provenance::automatic)
                tagging.service = pick(2) == 0 ? "keywords" : "rhythm";
            tagging.isAuto = pick(2) == 0;
            item.taggings.push_back(std::move(tagging));
        }
    }

    void addValues(contentdb::IndexedItem& item) {
        if (item.fileType != kFileTypeLoop) return;
        const double tempo = 60.0 + static_cast<double>(pick(120));
        item.values.push_back({"Tempo", pick(6) == 0 ? tempo + 0.37 : tempo});
        item.values.push_back({"BeatCount", static_cast<double>(4U << pick(4))});
        item.values.push_back({"LengthInSeconds", 0.01 * static_cast<double>(1 + pick(3000))});
        if (pick(9) == 0) item.values.push_back({"Comment", std::string("by hand")});
        if (pick(9) == 0) item.values.push_back({"Gain", -0.5 * static_cast<double>(pick(40))});
    }

    static constexpr std::array<std::string_view, 24> kWords = {
        "Kick", "Snare", "Loop",   "Bass",   "Deep",  "Warm",        "Pad",   "Synth",
        "Drum", "808",   "House",  "Techno", "Clap",  "Hat",         "Vocal", "Piano",
        "Dark", "Soft",  "Guitar", "Perc",   "Riser", "Caf\xc3\xa9", "Stab",  "Fx"};
    static constexpr std::array<std::string_view, 8> kOdd = {
        "'quoted\"",         "\nline",        "100%_", "\xf0\x9f\xa5\x81", "\xff\xfe raw",
        "Stra\xc3\x9f\x65 ", "e\xcc\x81tude", "-+,:"};
    static constexpr std::array<Tag, 16> kTags = {{{"Drums", "", "Source"},
                                                   {"Kick", "Drums", "Source"},
                                                   {"House", "Electronic", "Genres"},
                                                   {"Deep House", "House", "Genres"},
                                                   {"Rhythmic Density", "", "Sound Descriptors"},
                                                   {"Bright / Dark", "", "Sound Descriptors"},
                                                   {"A", "Key", "Loop Specifics"},
                                                   {"CSharp", "Key", "Loop Specifics"},
                                                   {"Minor KeyType", "Key Type", "Loop Specifics"},
                                                   {"Snare", "Drums", "Source"},
                                                   {"Techno", "Electronic", "Genres"},
                                                   {"Rhythmic Complexity", "", "Sound Descriptors"},
                                                   {"Reverb", "", "Effects"},
                                                   {"House", "", "Artist"},
                                                   {"Bass", "", "Source"},
                                                   {"Jazz", "", "Genres"}}};

    std::mt19937_64 random_;
    bool hasOddNames_;
};

}  // namespace qvct::test
