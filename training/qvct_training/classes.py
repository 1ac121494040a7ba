"""The classes that the model tells apart, and the families whose figures are reported."""

from dataclasses import dataclass


@dataclass(frozen=True)
class SoundClass:
    """A label of the taxonomy, what it is told by beside that, and the family that it belongs to."""

    name: str
    label: str
    family: str
    detail: str = ""


@dataclass(frozen=True)
class Family:
    """Classes that are often mistaken for each other, and the label that is right for all of them."""

    name: str
    label: str
    is_drum: bool


FAMILIES = [
    Family("Kick", "Kick", True),
    Family("Snare", "Snare", True),
    Family("Hi-Hat", "Hi-Hat", True),
    Family("Cymbal", "Cymbal", True),
    Family("Tom", "Tom", True),
    Family("Claps", "Claps", True),
    Family("Rim", "Rim", True),
    Family("Cowbell", "Cowbell", True),
    Family("Shaker", "Shaker", True),
    Family("Tambourine", "Tambourine", True),
    Family("Conga/Bongo", "Percussion", True),
    Family("Clave/Woodblock", "Percussion", True),
    Family("Other percussion", "Percussion", True),
    Family("Bass", "Bass", False),
    Family("Lead", "Lead", False),
    Family("Pad", "Pad", False),
    Family("Pluck", "Pluck", False),
    Family("Keyboard", "Keyboard", False),
    Family("Guitar", "Guitar", False),
    Family("Strings", "Strings", False),
    Family("Brass", "Brass", False),
    Family("Woodwinds", "Woodwinds", False),
    Family("Mallets", "Mallets", False),
    Family("Voice", "Voice", False),
    Family("Sound Effects", "Sound Effects", False),
]

CLASSES = [
    SoundClass("kick", "Kick", "Kick"),
    SoundClass("snare", "Snare", "Snare"),
    SoundClass("closed hat", "Hi-Hat", "Hi-Hat", "closed"),
    SoundClass("open hat", "Hi-Hat", "Hi-Hat", "open"),
    SoundClass("crash", "Crash", "Cymbal"),
    SoundClass("ride", "Ride", "Cymbal"),
    SoundClass("cymbal", "Cymbal", "Cymbal"),
    SoundClass("tom", "Tom", "Tom"),
    SoundClass("claps", "Claps", "Claps"),
    SoundClass("rim", "Rim", "Rim"),
    SoundClass("cowbell", "Cowbell", "Cowbell"),
    SoundClass("shaker", "Shaker", "Shaker"),
    SoundClass("tambourine", "Tambourine", "Tambourine"),
    SoundClass("conga", "Conga", "Conga/Bongo"),
    SoundClass("bongo", "Bongo", "Conga/Bongo"),
    SoundClass("clave", "Clave", "Clave/Woodblock"),
    SoundClass("woodblock", "Woodblock", "Clave/Woodblock"),
    SoundClass("percussion", "Percussion", "Other percussion"),
    SoundClass("bass", "Bass", "Bass"),
    SoundClass("lead", "Lead", "Lead"),
    SoundClass("pad", "Pad", "Pad"),
    SoundClass("pluck", "Pluck", "Pluck"),
    SoundClass("piano", "Piano", "Keyboard"),
    SoundClass("organ", "Organ", "Keyboard"),
    SoundClass("electric piano", "Electric Piano", "Keyboard"),
    SoundClass("keyboard", "Keyboard", "Keyboard"),
    SoundClass("guitar", "Guitar", "Guitar"),
    SoundClass("strings", "Strings", "Strings"),
    SoundClass("brass", "Brass", "Brass"),
    SoundClass("woodwinds", "Woodwinds", "Woodwinds"),
    SoundClass("mallets", "Mallets", "Mallets"),
    SoundClass("bells", "Bells", "Mallets"),
    SoundClass("voice", "Voice", "Voice"),
    SoundClass("effects", "Sound Effects", "Sound Effects"),
]

INDEX = {each.name: i for i, each in enumerate(CLASSES)}
FAMILY_INDEX = {each.name: i for i, each in enumerate(FAMILIES)}
FAMILY_OF_CLASS = [FAMILY_INDEX[each.family] for each in CLASSES]
