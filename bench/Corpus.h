#pragma once

#include "GrooveRenderer.h"
#include "media/midi/MidiSequence.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include <fmt/format.h>

namespace qvct::bench {

/// The drum kits and played grooves that the onset programs work with.
struct DrumCorpus {
    std::vector<Kit> kits;
    std::vector<MidiSequence> grooves;

    /// Ends the program where the corpus is absent.
    static DrumCorpus loadOrExit(const std::string& root) {
        DrumCorpus corpus;
        for (const std::string& folder : entriesOf(root + "/audio/drum-machines")) {
            if (!std::filesystem::is_directory(folder)) continue;
            if (auto kit = Kit::load(folder)) corpus.kits.push_back(std::move(*kit));
        }
        for (const std::string& file : entriesOf(root + "/midi/groove")) {
            if (!file.ends_with(".mid")) continue;
            auto groove = MidiSequence::read(file);
            if (groove && !groove->tracks().empty()) corpus.grooves.push_back(std::move(*groove));
        }
        if (!corpus.kits.empty() && !corpus.grooves.empty()) return corpus;
        fmt::print(stderr, "no grooves or drum machines below {}\n", root);
        std::exit(EXIT_FAILURE);
    }

    /// The kit that plays a groove.
    const Kit& kitFor(std::size_t groove, const Setting& setting) const {
        return kits[(groove + static_cast<std::size_t>(setting.kitShift)) % kits.size()];
    }

  private:
    static std::vector<std::string> entriesOf(const std::string& folder) {
        std::vector<std::string> entries;
        if (!std::filesystem::is_directory(folder)) return entries;
        for (const auto& entry : std::filesystem::directory_iterator(folder)) entries.push_back(entry.path());
        std::sort(entries.begin(), entries.end());
        return entries;
    }
};

}  // namespace qvct::bench
