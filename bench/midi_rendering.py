"""MIDI files made of notes, played with fluidsynth to 16-bit mono files."""

from __future__ import annotations

import struct
import subprocess
import tempfile
import wave
from array import array
from dataclasses import dataclass
from pathlib import Path

RATE = 44100
TICKS = 480  # to the beat, which lasts a second unless the tempo says otherwise
BEND_RANGE = 200  # cents, as General MIDI has it
DRUMS = 9  # the channel


@dataclass
class Note:
    start: float  # in beats
    beats: float
    key: int
    velocity: int = 90
    channel: int = 0
    cents: int = 0  # by which the whole channel is bent from here on


def number(value: int) -> bytes:
    """A variable-length number of a MIDI file."""
    digits = [value & 0x7F]
    while value := value >> 7:
        digits.append(0x80 | value & 0x7F)
    return bytes(reversed(digits))


def midi_file(notes: list[Note], programs: dict[int, int], bpm: float = 60) -> bytes:
    """A file of one track; `programs` by channel."""
    events = [(0, 0, bytes([0xC0 | channel, program])) for channel, program in programs.items()]
    for note in notes:
        on, off = round(note.start * TICKS), round((note.start + note.beats) * TICKS)
        bend = min(16383, 8192 + round(note.cents * 8192 / BEND_RANGE))
        events.append((on, 2, bytes([0xE0 | note.channel, bend & 0x7F, bend >> 7])))
        events.append((on, 3, bytes([0x90 | note.channel, note.key, note.velocity])))
        events.append((max(on + 1, off), 1, bytes([0x80 | note.channel, note.key, 0])))
    track = number(0) + bytes([0xFF, 0x51, 3]) + struct.pack(">I", round(60e6 / bpm))[1:]
    now = 0
    for tick, _, event in sorted(events, key=lambda entry: entry[:2]):
        track += number(tick - now) + event
        now = tick
    track += number(TICKS) + bytes([0xFF, 0x2F, 0])
    return struct.pack(">4sIHHH4sI", b"MThd", 6, 0, 1, TICKS, b"MTrk", len(track)) + track


def rendered(font: str, midi: bytes) -> array[float]:
    """The mix of both channels, with the reverberation and chorus that the synthesizer has by default."""
    with tempfile.TemporaryDirectory() as folder:
        song, sound = Path(folder, "song.mid"), Path(folder, "song.wav")
        song.write_bytes(midi)
        command = ["fluidsynth", "-qni", "-r", str(RATE), "-g", "0.6", "-F", str(sound), font, str(song)]
        subprocess.run(command, check=True, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        with wave.open(str(sound)) as file:
            both = array("h", file.readframes(file.getnframes()))
    return array("f", ((left + right) / 65536 for left, right in zip(both[0::2], both[1::2], strict=True)))


def write(path: Path, samples: array[float]) -> None:
    with wave.open(str(path), "wb") as file:
        file.setparams((1, 2, RATE, len(samples), "NONE", ""))
        file.writeframes(array("h", (round(max(-1, min(1, x)) * 32767) for x in samples)).tobytes())
