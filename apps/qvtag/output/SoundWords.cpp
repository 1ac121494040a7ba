#include "output/SoundWords.h"

#include "listening/HeardSound.h"
#include "platform/text/Text.h"

#include <array>
#include <cmath>
#include <vector>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

constexpr std::array<std::string_view, 12> kNotes = {"C",  "C#", "D",  "D#", "E",  "F",
                                                     "F#", "G",  "G#", "A",  "A#", "B"};

std::string_view nameOfPitchClass(int number) {
    return kNotes[static_cast<std::size_t>((number % 12 + 12) % 12)];
}

Json rounded(double value, double steps) {
    return std::round(value * steps) / steps;
}

Json rounded(const std::optional<double>& value, double steps) {
    return value ? rounded(*value, steps) : Json();
}

std::string percent(double confidence) {
    return fmt::format("{:.0f} %", confidence * 100);
}

/// What is shown as 0.0 has no sign.
double withoutMinusZero(double decibels) {
    return std::abs(decibels) < 0.05 ? 0 : decibels;
}

/// Whether it is a loop, if that is said at all.
std::optional<bool> isLoop(const HeardSound& sound) {
    constexpr double kEven = 0.5;
    if (!sound.loopConfidence) return std::nullopt;
    return *sound.loopConfidence > kEven;
}

Json confidencesOf(const HeardSound& sound) {
    constexpr double kSteps = 1000;
    Json json = Json::object();
    if (sound.loopConfidence)
        json["loop"] = rounded(std::max(*sound.loopConfidence, 1 - *sound.loopConfidence), kSteps);
    if (sound.note) json["note"] = rounded(sound.note->confidence, kSteps);
    if (sound.key) json["key"] = rounded(sound.key->confidence, kSteps);
    if (!sound.tempos.empty()) json["tempo"] = rounded(sound.tempos.front().confidence, kSteps);
    return json;
}

/// What it is, how long, how loud.
std::string factsOf(const HeardSound& sound) {
    std::vector<std::string> facts;
    if (const auto loop = isLoop(sound))
        facts.push_back(fmt::format("{} {}", *loop ? "loop" : "one-shot",
                                    percent(*loop ? *sound.loopConfidence : 1 - *sound.loopConfidence)));
    facts.push_back(fmt::format("{}{:.3g} s", sound.isCut ? "the first " : "", sound.seconds));
    facts.emplace_back(sound.isStereo ? "stereo" : "mono");
    if (sound.loudness) facts.push_back(fmt::format("{:.1f} LUFS", *sound.loudness));
    if (sound.truePeak) facts.push_back(fmt::format("peak {:.1f} dB", withoutMinusZero(*sound.truePeak)));
    return join(facts, "  ");
}

std::string musicOf(const HeardSound& sound) {
    std::vector<std::string> music;
    if (const auto& note = sound.note)
        music.push_back(fmt::format("{} {:+.0f} cents {}", nameOfNote(note->number), note->cents,
                                    percent(note->confidence)));
    if (const auto& key = sound.key)
        music.push_back(fmt::format("{} {}", nameOfKey(key->tonic, key->isMinor), percent(key->confidence)));
    for (const auto& tempo : sound.tempos)
        music.push_back(fmt::format("{:.4g} bpm {}", tempo.bpm, percent(tempo.confidence)));
    return join(music, "  ");
}

/// "Bright ─────●──── Dark    sharpness, acum 1.63"
std::string lineOf(const HeardSound::Trait& trait) {
    constexpr int kSteps = 20;
    const std::size_t slash = trait.scale.find(" / ");
    const auto at = static_cast<int>(std::lround(trait.level * kSteps));
    std::string line;
    for (int step = 0; step <= kSteps; ++step) line += step == at ? "●" : "─";
    return fmt::format("{:>8} {} {}  {} {:.3g}", trait.scale.substr(0, slash), line,
                       padded(trait.scale.substr(slash == std::string_view::npos ? 0 : slash + 3), 9),
                       trait.measure, trait.value);
}

}  // namespace

std::string nameOfNote(int number) {
    return fmt::format("{}{}", nameOfPitchClass(number), static_cast<int>(std::floor(number / 12.0)) - 1);
}

std::string nameOfKey(int tonic, bool isMinor) {
    return fmt::format("{} {}", nameOfPitchClass(tonic), isMinor ? "minor" : "major");
}

Json jsonOfSound(const std::string& path, const HeardSound& sound) {
    constexpr double kThousandths = 1000, kTenths = 10;
    Json json;
    json["path"] = path;
    json["instruments"] = Json::array();
    for (const auto& [label, confidence] : sound.instruments)
        json["instruments"].push_back({{"label", label}, {"confidence", rounded(confidence, kThousandths)}});
    json["character"] = Json::object();
    json["measures"] = Json::object();
    for (const auto& trait : sound.traits) {
        json["character"][std::string(trait.scale)] = rounded(trait.level, kThousandths);
        json["measures"][std::string(trait.measure)] = rounded(trait.value, kThousandths);
    }
    json["note"] = sound.note ? Json(nameOfNote(sound.note->number)) : Json();
    json["cents"] = sound.note ? rounded(sound.note->cents, kTenths) : Json();
    json["key"] = sound.key ? Json(nameOfPitchClass(sound.key->tonic)) : Json();
    json["mode"] = sound.key ? Json(sound.key->isMinor ? "minor" : "major") : Json();
    json["tempo"] = sound.tempos.empty() ? Json() : rounded(sound.tempos.front().bpm, kThousandths);
    json["tempos"] = Json::array();
    for (const auto& tempo : sound.tempos)
        json["tempos"].push_back({{"bpm", rounded(tempo.bpm, kThousandths)},
                                  {"beats", rounded(tempo.beats, kThousandths)},
                                  {"confidence", rounded(tempo.confidence, kThousandths)}});
    const auto loop = isLoop(sound);
    json["loop"] = loop ? Json(*loop) : Json();
    json["seconds"] = rounded(sound.seconds, kThousandths);
    json["cut"] = sound.isCut;
    json["stereo"] = sound.isStereo;
    json["loudness"] = rounded(sound.loudness, kTenths);
    json["truePeak"] = rounded(sound.truePeak, kTenths);
    json["onsets"] = Json::array();
    for (const std::int64_t onset : sound.onsets)
        json["onsets"].push_back(rounded(static_cast<double>(onset) / sound.sampleRate, kThousandths));
    json["confidences"] = confidencesOf(sound);
    return json;
}

std::vector<std::string> linesOfSound(const HeardSound& sound) {
    std::vector<std::string> lines = {factsOf(sound)};
    if (std::string music = musicOf(sound); !music.empty()) lines.push_back(std::move(music));
    for (const auto& trait : sound.traits) lines.push_back(lineOf(trait));
    return lines;
}

std::string textOfSound(const std::string& path, const HeardSound& sound, const Terminal& terminal) {
    constexpr std::size_t kMostInstruments = 3;
    constexpr double kWorthSaying = 0.1;
    std::vector<Word> instruments;
    for (const auto& [label, confidence] : sound.instruments) {
        const bool isFirst = instruments.empty();
        if (instruments.size() == kMostInstruments || (!isFirst && confidence < kWorthSaying)) break;
        instruments.push_back(
            {fmt::format("{} {}", label, percent(confidence)), isFirst ? Color::strong : Color::faint});
    }
    std::string text = printable(path) + "\n";
    if (!instruments.empty()) text += "  " + wrapped(terminal, instruments, 2) + "\n";
    for (const std::string& line : linesOfSound(sound)) text += "  " + line + "\n";
    return text;
}

}  // namespace qvct::tool
