"""Which class each program and each drum key of General MIDI belongs to; what is ambiguous is left out."""

DRUM_KEYS = {
    35: "kick", 36: "kick", 37: "rim", 38: "snare", 39: "claps", 40: "snare", 41: "tom", 42: "closed hat",
    43: "tom", 44: "closed hat", 45: "tom", 46: "open hat", 47: "tom", 48: "tom", 49: "crash", 50: "tom",
    51: "ride", 52: "cymbal", 53: "ride", 54: "tambourine", 55: "cymbal", 56: "cowbell", 57: "crash",
    59: "ride", 60: "bongo", 61: "bongo", 62: "conga", 63: "conga", 64: "conga", 65: "percussion",
    66: "percussion", 67: "percussion", 68: "percussion", 69: "shaker", 70: "shaker", 73: "percussion",
    74: "percussion", 75: "clave", 76: "woodblock", 77: "woodblock", 80: "percussion", 81: "percussion",
    82: "shaker", 83: "percussion", 85: "percussion",
}  # fmt: skip
BRUSH_KIT, ORCHESTRA_KIT = 40, 48
NOT_BRUSHED = {39}  # a slap of brushes
NOT_IN_ORCHESTRA = set(range(39, 54)) | {55}  # timpani, and cymbals elsewhere

_RANGES = [
    (range(4), "piano"), (range(4, 6), "electric piano"), (range(6, 8), "keyboard"), (range(9, 10), "bells"),
    (range(11, 14), "mallets"), (range(14, 15), "bells"), (range(16, 21), "organ"), (range(21, 22), "keyboard"),
    (range(23, 24), "keyboard"), (range(24, 32), "guitar"), (range(32, 40), "bass"), (range(40, 46), "strings"),
    (range(48, 52), "strings"), (range(52, 55), "voice"), (range(56, 64), "brass"), (range(64, 80), "woodwinds"),
    (range(80, 87), "lead"), (range(88, 96), "pad"), (range(108, 109), "mallets"), (range(110, 111), "strings"),
    (range(114, 115), "mallets"), (range(119, 128), "effects"),
]  # fmt: skip
PROGRAMS = {program: name for programs, name in _RANGES for program in programs}

# The keys that each class is played at: where its instruments sound as they do in music.
KEYS = {
    "bass": (26, 52), "lead": (52, 88), "pad": (43, 79), "piano": (31, 96), "electric piano": (36, 88),
    "organ": (36, 90), "keyboard": (40, 86), "guitar": (40, 80), "strings": (38, 88), "brass": (40, 80),
    "woodwinds": (48, 88), "mallets": (48, 96), "bells": (60, 96), "voice": (45, 79), "effects": (36, 84),
}  # fmt: skip


def drum_class(kit: int, key: int) -> str | None:
    """The class of a key of a drum kit."""
    if kit == BRUSH_KIT and key in NOT_BRUSHED:
        return None
    if kit == ORCHESTRA_KIT and key in NOT_IN_ORCHESTRA:
        return None
    return DRUM_KEYS.get(key)
