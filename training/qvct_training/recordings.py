"""Recorded sounds: which class each file is of, told by its name, and where it comes from."""

import re
from collections.abc import Iterator
from dataclasses import dataclass
from pathlib import Path
from typing import Any

import numpy as np
import numpy.typing as npt
import soundfile
from scipy import signal

from .dsp import RATE

MOST_SECONDS = 2.2

# Tried in this order on a file's name, in small letters; None is a sound that no class stands for.
_NAMES: list[tuple[str, str | None]] = [
    (r"loop|brk|break|roll|flam|fx|vinyl|scratch|stomp|heel|hit$", None),
    (r"conga", "conga"),
    (r"bongo", "bongo"),
    (r"\btom-", "tom"),  # "tom-hh" is a high one
    (r"hi?_?-?h?at.*pedal|pedal.*h(h|at)|hh_?ped|hhp", "closed hat"),
    (r"(hh?|hi-?_?h?at|hat).*(open|opn)|open.*(hh|hat)|hho|hat_?o\b|_oh\b|^oh\d|ophat", "open hat"),
    (r"hi-?_?h?at|hihat|\bhh|hat\b|hat[_\d]|hhc|chat|^ch\d|_ch\b|closedhat", "closed hat"),
    (r"snap", "percussion"),
    (r"clap", "claps"),
    (r"rim|side_?-?stick|stick[-_ ]?[lmh]?$|cross_?stick|xstick", "rim"),
    (r"cow_?b|agogo.?cow", "cowbell"),
    (r"tamb", "tambourine"),
    (r"shak|cabas|marac|caxixi|egg", "shaker"),
    (r"clave", "clave"),
    (r"wood|block", "woodblock"),
    (r"crash", "crash"),
    (r"ride", "ride"),
    (r"splash|china|cym", "cymbal"),
    (r"tom", "tom"),
    (r"kick|\bbd|bass_?-?drum|^bd|_bd|\bkik|\bkck", "kick"),
    (r"snare|\bsn|\bsd|^sd|_sd|sidesn|snr", "snare"),
    (r"guiro|triang|agogo|timbal|whistle|vibrasl|cuica|tabla|djembe|udu|darb|bell", "percussion"),
]


# How the Synthesis ToolKit keeps its waves.
_RAW: dict[str, Any] = {"samplerate": 22050, "channels": 1, "format": "RAW", "subtype": "PCM_16", "endian": "BIG"}


@dataclass(frozen=True)
class Recording:
    """A file, its class and the kit that is left out with it."""

    path: Path
    name: str
    kit: str


def class_by_name(stem: str) -> str | None:
    """The class that a file's name tells, or nothing."""
    small = re.sub(r"[^a-z0-9_-]", " ", stem.lower())
    return next((name for pattern, name in _NAMES if re.search(pattern, small)), None)


def load(path: Path) -> npt.NDArray[np.float32]:
    """The beginning of a file, mono, at RATE."""
    with soundfile.SoundFile(path, **(_RAW if path.suffix == ".raw" else {})) as file:
        rate = file.samplerate
        sound = file.read(int(MOST_SECONDS * rate), dtype="float64", always_2d=True).mean(axis=1)
    if rate != RATE:
        common = np.gcd(rate, RATE)
        sound = signal.resample_poly(sound, RATE // common, rate // common)
    return np.asarray(sound, dtype=np.float32)


def _is_readable(path: Path) -> bool:
    try:
        return bool(soundfile.info(path).frames > 0)
    except soundfile.LibsndfileError:
        return False


def by_name(folder: Path, prefix: str = "") -> Iterator[Recording]:
    """The files below a folder whose names tell a class; each folder is a kit."""
    for path in sorted(folder.rglob("*")):
        if path.suffix.lower() not in (".wav", ".flac", ".ogg", ".aif", ".aiff"):
            continue
        name = class_by_name(path.stem)
        if name is not None and _is_readable(path):
            yield Recording(path, name, prefix + path.parent.name)


# Names of the live coding samples that the patterns above do not tell.
_LIVE_CODING = {
    "bass_": "bass",
    "guit_": "guitar",
    "drum_heavy_kick": "kick",
    "drum_bass_": "kick",
    "drum_snare": "snare",
    "drum_tom": "tom",
    "drum_cymbal_closed": "closed hat",
    "drum_cymbal_pedal": "closed hat",
    "drum_cymbal_open": "open hat",
    "elec_blip": "effects",
    "elec_beep": "effects",
    "ambi_choir": "voice",
    "ambi_drone": "pad",
    "ambi_haunted": "pad",
    "ambi_soft": "pad",
    "ambi_dark": "effects",
    "ambi_swoosh": "effects",
    "perc_swash": "effects",
    "perc_swoosh": "effects",
    "perc_impact": "effects",
    "vinyl_": "effects",
    "mehackit_": "effects",
    "glitch_robot": "effects",
    "hat_cats": "open hat",
    "hat_gump": "open hat",
    "hat_noiz": "open hat",
    "tbd_pad": "pad",
    "bd_": "kick",
    "sn_": "snare",
    "tabla_": "percussion",
    "loop_": "",
    "drum_roll": "",
}


def live_coding(folder: Path) -> Iterator[Recording]:
    """The CC0 samples of the npm package supersonic-scsynth-samples."""
    for path in sorted(folder.glob("*.flac")):
        known = next((name for start, name in _LIVE_CODING.items() if path.stem.startswith(start)), None)
        name = class_by_name(path.stem) if known is None else known
        if name:
            yield Recording(path, name, "live coding")


_TOOLKIT_DRUMS = {
    "bassdrum": "kick",
    "snardrum": "snare",
    "hihatcym": "closed hat",
    "ridecymb": "ride",
    "crashcym": "crash",
    "cowbell1": "cowbell",
    "tambourn": "tambourine",
    "tomhidrm": "tom",
    "tommiddr": "tom",
    "tomlowdr": "tom",
}


def toolkit_drums(folder: Path) -> Iterator[Recording]:
    """The drums among the waves of Debian's package stk."""
    for stem, name in _TOOLKIT_DRUMS.items():
        yield Recording(folder / f"{stem}.raw", name, "stk")


_LABELS = {
    "Kick": "kick",
    "Snare": "snare",
    "Tom": "tom",
    "Rim": "rim",
    "Claps": "claps",
    "Finger Snaps": "percussion",
    "Percussion": "percussion",
    "Saxophone": "woodwinds",
    "Electric Guitar": "guitar",
    "Acoustic Guitar": "guitar",
    "Acoustic Bass": "bass",
    "Double Bass": "strings",
}
_OPEN_HATS = re.compile(r"-h[loh]_")


def labelled(folder: Path) -> Iterator[Recording]:
    """The CC0 recordings that a table `labels.tsv` in their folder describes."""
    for line in (folder / "labels.tsv").read_text().splitlines()[1:]:
        path, label, _ = line.split("\t")
        name = _LABELS.get(label)
        if label == "Hi-Hat":
            name = "open hat" if _OPEN_HATS.search(path) else "closed hat"
        if name is not None:
            yield Recording(folder / path, name, path.split("/")[0])
