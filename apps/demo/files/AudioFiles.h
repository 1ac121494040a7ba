#pragma once

#include "demo/Sound.h"

#include <string>
#include <string_view>

/// Short writers of the three audio containers. They are independent of the library that reads them, so that
/// what they write can serve as fixtures. Each fact of a Sound goes to the open chunk that other programs use
/// for it.
///
/// | fact    | WAV            | AIFF                 | CAF                            |
/// |---------|----------------|----------------------|--------------------------------|
/// | name    | LIST INFO INAM | NAME                 | info "title"                   |
/// | root    | acid, smpl     | INST                 | inst; info "key signature"     |
/// | loop    | acid, smpl     | INST sustain, MARK   | info "tempo", "time signature" |
/// | markers | cue, LIST adtl | MARK                 | mark, strg                     |
/// | notes   |                | MIDI                 | midi                           |
namespace qvct::demo {

/// The whole file, in memory. Throws std::invalid_argument for a sample width that is not 16, 24 or 32 bits.
std::string wavBytes(const Sound& sound);
std::string aiffBytes(const Sound& sound);
std::string cafBytes(const Sound& sound);

/// Makes or replaces a file and the folders above it. Throws std::system_error naming the path.
void writeFile(const std::string& path, std::string_view bytes);

void writeWav(const std::string& path, const Sound& sound);
void writeAiff(const std::string& path, const Sound& sound);
void writeCaf(const std::string& path, const Sound& sound);

/// As the extension says: wav, aif, aiff or caf. Throws std::invalid_argument for another.
void writeSound(const std::string& path, const Sound& sound);

}  // namespace qvct::demo
