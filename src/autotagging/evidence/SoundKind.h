#pragma once

#include <cstdint>

namespace qvct {

/// Whether a sound is made to be repeated, or to be played once.
enum class SoundKind : std::uint8_t { unsaid, loop, oneShot };

}  // namespace qvct
