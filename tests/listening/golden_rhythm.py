#!/usr/bin/env python3
"""Golden values of rhythmic density and complexity, worked out without the library.

Plain scans over plain lists, with every single-precision step rounded through struct.
Run it to write GoldenRhythm.inc anew: python3 golden_rhythm.py > GoldenRhythm.inc
"""
import math
import random
import struct

INFINITY = float("inf")
NAN = float("nan")


def f32(x):
    return struct.unpack("<f", struct.pack("<f", x))[0]


def first_velocity(notes, low, high):
    for start, velocity in notes:
        if low <= start < high:
            return velocity
    return 0


def divide(a, b):
    return f32(a / b) if b != 0 else NAN


# --- self-dissimilarity -------------------------------------------------------------------------------------

def group_distance(notes, intervals, first, size, resolution):
    cells = int((intervals[first][1] - intervals[first][0]) / resolution)
    total = 0.0
    for cell in range(cells):
        offset = cell * resolution
        v = [first_velocity(notes, a + offset, a + offset + resolution)
             for a, _ in intervals[first:first + size]]
        if size == 2:
            total = f32(total + f32(abs(v[0] - v[1]) * (1 / 127)))
        elif size == 3:
            for i, j in ((1, 0), (1, 2), (0, 2)):
                total = f32(total + f32(abs(v[i] - v[j]) * (1 / 127) / 3))
    d = divide(total, cells)
    return f32(f32(d + d) - d * d)


def complexity_of(notes, length, divisions):
    step = f32(length / divisions[0])
    intervals = []
    for i in range(divisions[0]):
        start = f32(i * step)
        intervals.append((start, start + step))
    levels = []
    for level, division in enumerate(divisions):
        total = 0.0
        for i in range(0, len(intervals), division):
            total = f32(total + group_distance(notes, intervals, i, division, 0.125))
        levels.append(divide(total, len(intervals) // division))
        if level + 1 < len(divisions):
            parts = divisions[level + 1]
            finer = []
            for a, b in intervals:
                sub = f32((b - a) / parts)
                finer += [(a + f32(k * sub), a + f32(k * sub) + sub) for k in range(parts)]
            intervals = finer
    result = levels[-1]
    for score in reversed(levels[:-1]):
        result = f32(result + score)
    return f32(result / len(divisions)), levels


def divisions_of(beats):
    divisions, x = [], float(beats)
    while True:
        n = int(x)
        three = n % 2 == 1 and n % 3 == 0
        divisions.append(3 if three else 2)
        x = f32(x * (f32(0.33333334) if three else 0.5))
        if x <= 0.125:
            return divisions


# --- reduction ----------------------------------------------------------------------------------------------

def reduced(notes):
    """Complete linkage, tried on every pair again after every merge."""
    clusters = [[note] for note in notes]
    while True:
        best = None
        for i in range(len(clusters)):
            for j in range(i + 1, len(clusters)):
                far = max(f32(abs(a[0] - b[0])) for a in clusters[i] for b in clusters[j])
                if far <= 0.125 and (best is None or far < best[0]):
                    best = (far, i, j)
        if best is None:
            break
        _, i, j = best
        clusters[i] += clusters.pop(j)
    grid = []
    for cluster in clusters:
        start, velocity = min(cluster, key=lambda note: note[0])
        r = math.fmod(start, 0.125)
        grid.append((start + (0.125 - r) if r > 0.0625 else start - r, velocity))
    return grid


# --- metre --------------------------------------------------------------------------------------------------

def power(u):
    return f32(f32(0.7) ** u)


def bar_pattern(top, bottom):
    if top in (2, 4):
        n = (8 if bottom == 4 else 16) * top
        bar = [0.0] * n
        bar[0] = 1.0
        for u in range(4 if (top, bottom) == (2, 4) else 5):
            for j in range(2 ** u):
                bar[(2 * j + 1) * n // 2 ** (u + 1)] = power(u + 1)
        return bar
    if top == 3:
        strong, size = [[8, 16], [4, 12, 20], range(2, 24, 2), range(24)], 24
    elif top == 6:
        strong, size = [[12], [4, 8, 16, 20], range(2, 24, 2), range(24)], 24
    elif top == 9:
        strong, size = [[12, 24], range(4, 36, 4), range(2, 36, 2), range(36)], 36
    elif top == 12:
        strong, size = [[24], [12, 36], range(4, 48, 4), range(2, 48, 2), range(48)], 48
    else:
        return []
    bar = [1.0] + [None] * (size - 1)
    for u, cells in enumerate(strong):
        for cell in cells:
            if bar[cell] is None:
                bar[cell] = power(u + 1)
    return bar


def syncopation(notes, beats, top, bottom):
    mask = [f32(1 - v) for v in bar_pattern(top, bottom) * (beats // top)]
    if len(mask) != 32 // bottom * beats:
        return NAN
    total, count = 0.0, 0
    for i, weight in enumerate(mask):
        velocity = first_velocity(notes, i * 0.125, i * 0.125 + 0.125)
        if velocity:
            total = f32(total + f32(weight * (1 / 127) * velocity))
            count += 1
    return f32(f32(divide(total, count) * f32(0.4)) - f32(0.2))


# --- both measures ------------------------------------------------------------------------------------------

def shifted(notes, beats):
    last, shift = f32(notes[-1][0]), 0.0
    while last >= beats:
        last, shift = f32(last - beats), f32(shift + beats)
    return [(start - shift, velocity) for start, velocity in notes]


def density(notes, beats, bottom):
    cells = beats * (8 if bottom == 4 else 4)
    width = f32(beats / cells)
    hits = 0
    for i in range(cells):
        low = f32(i * width)
        hits += any(low <= start < low + width for start, _ in notes)
    x = f32(hits / cells)
    return max(0.0, f32(math.log(x * 0.9502129331231117 + 0.049787066876888275) / 3 + 1))


def complexity(notes, beats, top, bottom):
    if not notes or top in (5, 7):
        return 0.0, []
    notes = reduced(notes)
    c, levels = complexity_of(notes, beats, divisions_of(beats))
    h = f32(math.log(c * 0.8891968503594398 + 0.11080314964056015) * 0.4545454446934474 + 1)
    total = f32(h + syncopation(notes, beats, top, bottom))
    return (min(total, 1.0) if total > 0 else 0.0), levels


# --- the cases ----------------------------------------------------------------------------------------------

def cases():
    four = [(i, 100) for i in range(4)]
    yield "four on the floor", 4, 4, 4, four
    yield "offbeats", 4, 4, 4, [(i + 0.5, 100) for i in range(4)]
    yield "son clave", 8, 4, 4, [(t, 127) for t in (0, 1.5, 3, 5, 6)]
    yield "a note on every cell", 4, 4, 4, [(i / 8, 127) for i in range(32)]
    yield "full first half, empty second", 4, 4, 4, [(i / 8, 127) for i in range(16)]
    yield "one downbeat", 4, 4, 4, [(0, 127)]
    yield "one weak note", 4, 4, 4, [(2.875, 1)]
    yield "half a cell late stays, a little more moves on", 4, 4, 4, [(0.0625, 90), (1.0625000001, 90)]
    yield "on the edge of a cell", 4, 4, 4, [(0.12499999, 80), (0.75, 60), (0.875, 40)]
    yield "the first note of a cell counts, not the loudest", 4, 4, 4, [(1, 20), (1.01, 127), (3, 127)]
    yield "clusters as wide as the threshold", 4, 4, 4, [(0, 50), (0.125, 60), (0.25, 70), (0.375, 80)]
    yield "two clusters in one cell", 4, 4, 4, [(0.07, 30), (0.17, 90), (0.18, 120), (0.3, 10)]
    yield "two loops late", 4, 4, 4, [(8, 100), (8.75, 90), (9, 80)]
    yield "last note a loop late, the others before the span", 4, 4, 4, [(0, 100), (3.3, 50), (5.5, 80)]
    yield "5/4", 5, 5, 4, [(i, 100) for i in range(5)]
    yield "7/8", 7, 7, 8, [(i / 2, 100) for i in range(7)]
    yield "no whole number of bars", 6, 4, 4, four
    generator = random.Random(1789)
    signatures = [(4, 4, 4), (16, 4, 4), (2, 2, 4), (8, 2, 4), (3, 3, 4), (12, 3, 4), (9, 3, 4), (6, 6, 8),
                  (12, 6, 8), (9, 9, 8), (27, 9, 8), (12, 12, 8), (24, 12, 8), (4, 2, 2), (4, 4, 2), (4, 2, 8),
                  (8, 4, 8), (3, 3, 8), (6, 6, 4), (15, 3, 4), (10, 2, 4), (1, 1, 4), (11, 11, 8), (8, 4, 16)]
    for beats, top, bottom in signatures:
        for count in (3, 17, 60):
            notes = sorted((round(generator.uniform(0, beats), generator.choice((1, 3, 6))),
                            generator.randint(1, 127)) for _ in range(count))
            yield f"{count} notes in {top}/{bottom}", beats, top, bottom, notes


def main():
    print("// Written by golden_rhythm.py.")
    for name, beats, top, bottom, notes in cases():
        inside = shifted(notes, beats)
        measured, levels = complexity(inside, beats, top, bottom)
        listed = ", ".join(f"{{{start!r}, {velocity}}}" for start, velocity in notes)
        scores = ", ".join("NAN" if math.isnan(level) else float.hex(level) for level in levels)
        print(f'{{"{name}", {beats}, {top}, {bottom}, {float.hex(density(inside, beats, bottom))}, '
              f"{float.hex(measured)},\n {{{scores}}},\n {{{listed}}}}},")


if __name__ == "__main__":
    main()
