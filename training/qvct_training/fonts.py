"""Notes of sound fonts, rendered by fluidsynth."""

import subprocess
import tempfile
from collections.abc import Iterable, Iterator
from dataclasses import dataclass
from pathlib import Path

import numpy as np
import numpy.typing as npt
import soundfile

from . import general_midi
from .dsp import RATE, Random

SPACING = 2.6  # seconds from one note to the next
AT_ONCE = 400  # notes in a score, so that its sound fits into memory
_TICKS = 480  # of a quarter note, at 120 quarter notes a minute

Samples = npt.NDArray[np.float32]


@dataclass(frozen=True)
class Note:
    """One note, and the class that it is an example of."""

    name: str
    drum: bool
    bank: int
    program: int
    key: int
    velocity: int
    seconds: float


def _quantity(value: int) -> bytes:
    out = [value & 0x7F]
    while value := value >> 7:
        out.append(0x80 | (value & 0x7F))
    return bytes(reversed(out))


def midi_file(notes: Iterable[Note]) -> bytes:
    """The notes one after the other, in one track."""
    events: list[tuple[int, bytes]] = []
    for i, note in enumerate(notes):
        start, length = (int(s * 2 * _TICKS) for s in (i * SPACING, note.seconds))
        channel = 9 if note.drum else 0
        if not note.drum:
            events.append((start, bytes([0xB0 | channel, 0, note.bank])))
        events.append((start, bytes([0xC0 | channel, note.program])))
        events.append((start, bytes([0x90 | channel, note.key, note.velocity])))
        events.append((start + length, bytes([0x80 | channel, note.key, 0])))
    track, now = b"", 0
    for tick, event in events:
        track += _quantity(tick - now) + event
        now = tick
    track += _quantity(_TICKS) + b"\xff\x2f\x00"
    head = b"MThd" + (6).to_bytes(4, "big") + bytes([0, 0, 0, 1]) + _TICKS.to_bytes(2, "big")
    return head + b"MTrk" + len(track).to_bytes(4, "big") + track


def drum_notes(kits: Iterable[int], random: Random) -> list[Note]:
    """Every key of the kits that has a class, softly and loudly."""
    notes = []
    for kit in kits:
        for key in general_midi.DRUM_KEYS:
            name = general_midi.drum_class(kit, key)
            for velocity in (70, 115):
                if name is not None:
                    notes.append(Note(name, True, 0, kit, key, velocity + int(random.integers(12)), 1.5))
    return notes


def tonal_notes(each: int, banks: Iterable[int], random: Random) -> list[Note]:
    """Notes of every program that has a class, of many pitches, velocities and lengths."""
    notes = []
    for bank in banks:
        for program, name in general_midi.PROGRAMS.items():
            low, high = general_midi.KEYS[name]
            for i in range(each):
                key = low + int((high - low) * (i + random.random()) / each)
                seconds = float(random.choice([0.15, 0.4, 0.9, 2.0]))
                notes.append(Note(name, False, bank, program, key, int(random.integers(50, 125)), seconds))
    return notes


def render(font: Path, notes: list[Note]) -> Iterator[Samples]:
    """Each note with what sounds after it, mono, cut where it has died away."""
    for start in range(0, len(notes), AT_ONCE):
        yield from _rendered(font, notes[start : start + AT_ONCE])


def _rendered(font: Path, notes: list[Note]) -> list[Samples]:
    with tempfile.TemporaryDirectory() as folder:
        score, wav = Path(folder) / "notes.mid", Path(folder) / "notes.wav"
        score.write_bytes(midi_file(notes))
        options = ["-ni", "-q", "-R", "0", "-C", "0", "-g", "0.6", "-r", str(RATE), "-o", "synth.midi-bank-select=gs"]
        subprocess.run(
            ["fluidsynth", *options, "-T", "wav", "-O", "s16", "-F", str(wav), str(font), str(score)],
            check=True,
            stdout=subprocess.DEVNULL,
            stderr=subprocess.DEVNULL,
        )
        sound, _ = soundfile.read(wav, dtype="float32", always_2d=True)
    mono = sound.mean(axis=1)
    length, kept = int(SPACING * RATE), int(2.1 * RATE)
    return [mono[i * length : i * length + kept] for i in range(len(notes))]
