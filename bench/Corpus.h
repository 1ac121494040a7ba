#pragma once

#include "GrooveRenderer.h"
#include "media/midi/MidiSequence.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include <fmt/format.h>

namespace qvct::bench {

/// The grooves, in the order of their names, count from 0: the even ones, the microphone in front of the
/// acoustic kit and every even note of the instruments are there to choose parameters by; the odd ones and
/// another microphone's recordings of other strokes are only measured on.
enum Part { kTuning, kMeasuring };

/// The drum kits, instruments and played grooves that the onset programs work with.
struct DrumCorpus {
    std::vector<Kit> machines;
    std::vector<MidiSequence> grooves;
    std::array<std::optional<Kit>, 2> acoustic;  ///< By part; nothing where the sounds are absent.
    std::array<std::vector<Sound>, 2> notes;     ///< By part.

    /// Ends the program where the corpus is absent.
    static DrumCorpus loadOrExit(const std::string& root, const std::string& sounds = "") {
        DrumCorpus corpus;
        for (const std::string& folder : entriesOf(root + "/audio/drum-machines")) {
            if (!std::filesystem::is_directory(folder)) continue;
            if (auto kit = Kit::machine(folder)) corpus.machines.push_back(std::move(*kit));
        }
        for (const std::string& file : entriesOf(root + "/midi/groove")) {
            if (!file.ends_with(".mid")) continue;
            auto groove = MidiSequence::read(file);
            if (groove && !groove->tracks().empty()) corpus.grooves.push_back(std::move(*groove));
        }
        if (!sounds.empty()) corpus.loadSounds(sounds);
        if (!corpus.machines.empty() && !corpus.grooves.empty()) return corpus;
        fmt::print(stderr, "no grooves or drum machines below {}\n", root);
        std::exit(EXIT_FAILURE);
    }

    static Part partOf(std::size_t groove) { return groove % 2 == 0 ? kTuning : kMeasuring; }

    bool canPlay(const Setting& setting) const {
        return setting.player == Setting::kMachine || (acoustic[kTuning] && !notes[kTuning].empty());
    }
    Rendering render(std::size_t groove, const Setting& setting, double seconds) const {
        const Part part = partOf(groove);
        const Kit& kit = setting.player == Setting::kMachine
                             ? machines[(groove + setting.kitShift) % machines.size()]
                             : *acoustic[part];
        return bench::render(grooves[groove], {&kit, &notes[part]}, setting, seconds);
    }

  private:
    void loadSounds(const std::string& folder) {
        acoustic[kTuning] = Kit::acoustic(folder + "/acoustic-kit", "front_mic", "12");
        acoustic[kMeasuring] = Kit::acoustic(folder + "/acoustic-kit", "retro_mic", "34");
        std::size_t count = 0;
        for (const char* instrument : {"acoustic-bass", "acoustic-guitar", "electric-guitar", "saxophone"}) {
            for (const std::string& file : entriesOf(folder + "/" + instrument))
                notes[count++ % 2].push_back(loadSound(file, 0.1F));
        }
    }

    static std::vector<std::string> entriesOf(const std::string& folder) {
        std::vector<std::string> entries;
        if (!std::filesystem::is_directory(folder)) return entries;
        for (const auto& entry : std::filesystem::directory_iterator(folder)) entries.push_back(entry.path());
        std::sort(entries.begin(), entries.end());
        return entries;
    }
};

}  // namespace qvct::bench
