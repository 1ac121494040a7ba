#pragma once

#include "autotagging/names/NamePieces.h"
#include "autotagging/names/NamedKey.h"
#include "autotagging/names/NamingHabits.h"

#include <optional>
#include <span>
#include <string_view>
#include <vector>

namespace qvct {

/// What may be a key in a name.
struct ScannedKey {
    NamedKey key;
    std::size_t piece = 0;
    bool isAnnounced = false;  ///< By "key".
    bool isBehindPitched = false;
    bool isVariant = false;  ///< "Take C", "E string", "Clarinet in B".
};

/// What else the name says that lets a letter be a key, or not.
struct KeyContext {
    const NamingHabits& habits;
    std::string_view name;
    std::span<const NamePiece> pieces;
    std::optional<double> tempo = std::nullopt;
    bool isFolder = false;
    bool isLoop = false;
    bool isLayer = false;         ///< It says which layer of an instrument it is.
    bool hasNote = false;         ///< "C3", of one note of an instrument.
    bool beginsWithNote = false;  ///< Which may number it: "B9-Am".
    bool hasMeaning = false;      ///< Some word stands for a tag.
    bool hasPitched = false;      ///< One of these is of something with a pitch.
    bool hasNumber = false;       ///< One that may be a tempo.
};

/// The key that a name states; nothing when none can stand where it does, or several are stated.
std::optional<NamedKey> chosenKey(std::span<const ScannedKey> keys, const KeyContext& context);

}  // namespace qvct
