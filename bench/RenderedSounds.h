#pragma once

#include "listening/sound/SoundExcerpt.h"
#include "media/audio/AudioDecoder.h"

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <fmt/format.h>

namespace qvct::bench {

/// One line of the truth.tsv that `render-notes` or `render-pieces` writes beside its sounds.
struct RenderedSound {
    std::string path;
    std::string kind;
    std::string number;  ///< The program or key of a note, the tonic of a piece.
    std::string truth;   ///< The pitch or the mode.

    SoundExcerpt excerpt(double mostSeconds) const {
        const auto decoder = AudioDecoder::open(path);
        if (decoder) return SoundExcerpt::of(*decoder, mostSeconds);
        fmt::print(stderr, "{} cannot be read\n", path);
        std::exit(EXIT_FAILURE);
    }
};

/// Ends the program where a folder holds no rendered sounds.
inline std::vector<RenderedSound> soundsOrExit(const std::string& folder) {
    std::ifstream file(folder + "/truth.tsv");
    std::vector<RenderedSound> sounds;
    for (std::string line; std::getline(file, line);) {
        std::istringstream words(line);
        RenderedSound sound;
        std::string name;
        std::getline(words, name, '\t') && std::getline(words, sound.kind, '\t') &&
            std::getline(words, sound.number, '\t') && std::getline(words, sound.truth);
        sound.path = folder + "/" + name;
        sounds.push_back(sound);
    }
    if (!sounds.empty()) return sounds;
    fmt::print(stderr, "no truth.tsv in {}\n", folder);
    std::exit(EXIT_FAILURE);
}

}  // namespace qvct::bench
