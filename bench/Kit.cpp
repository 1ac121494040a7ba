#include "Kit.h"

#include "SynthSounds.h"
#include "media/audio/AudioDecoder.h"

#include <algorithm>
#include <cmath>
#include <filesystem>

namespace qvct::bench {
namespace {

std::vector<std::string> filesOf(const std::string& folder) {
    std::vector<std::string> files;
    if (!std::filesystem::is_directory(folder)) return files;
    for (const auto& entry : std::filesystem::directory_iterator(folder))
        files.push_back(entry.path().string());
    std::sort(files.begin(), files.end());
    return files;
}

}  // namespace

// By linear interpolation; a kit's sounds need no better.
Sound loadSound(const std::string& path, float share) {
    Sound sound;
    const auto decoder = AudioDecoder::open(path);
    if (!decoder) return sound;
    const auto channels = static_cast<std::size_t>(decoder->channels());
    std::vector<float> frames(static_cast<std::size_t>(decoder->frames()) * channels);
    frames.resize(decoder->read(frames) * channels);
    const double step = double(decoder->sampleRate()) / kRate;
    float loudest = 0;
    for (double at = 0; (static_cast<std::size_t>(at) + 2) * channels <= frames.size(); at += step) {
        const auto i = static_cast<std::size_t>(at);
        const auto part = static_cast<float>(at - double(i));
        sound.samples.push_back(frames[i * channels] * (1 - part) + frames[(i + 1) * channels] * part);
        loudest = std::max(loudest, std::abs(sound.samples.back()));
    }
    while (sound.attack < sound.samples.size() && std::abs(sound.samples[sound.attack]) < share * loudest) {
        ++sound.attack;
    }
    return sound;
}

std::optional<Kit> Kit::machine(const std::string& folder) {
    // The first part of a file name that is found plays the sound; machines without it borrow the next best.
    static constexpr const char* kNames[kPartCount][4] = {{"kick-accent", "kick.", "kick", ""},
                                                          {"snare-accent", "snare-m", "snare.", "snare"},
                                                          {"rim", "stick-m", "clave", ""},
                                                          {"hihat-closed.", "hihat-closed", "hihat.", ""},
                                                          {"hihat-closed.", "hihat-closed", "hihat.", ""},
                                                          {"hihat-open", "hihat-metal", "", ""},
                                                          {"tom-l.", "conga-l", "tom.", ""},
                                                          {"tom-h.", "bongo-h", "tom.", ""},
                                                          {"tom-h.", "bongo-h", "tom.", ""},
                                                          {"crash", "cymball-long", "cymbal", ""},
                                                          {"ride", "cymball-short", "tamb-long", ""}};
    const std::vector<std::string> files = filesOf(folder);
    Kit kit;
    for (std::size_t part = 0; part < kPartCount; ++part) {
        for (const char* name : kNames[part]) {
            const auto file = std::find_if(files.begin(), files.end(), [&](const std::string& path) {
                return *name && path.find(name, folder.size()) != std::string::npos;
            });
            if (file == files.end() || !kit.parts_[part].empty()) continue;
            kit.parts_[part].push_back({{loadSound(*file, 0)}});
        }
    }
    if (!kit.plays(kKick) || !kit.plays(kSnare) || !kit.plays(kClosedHat)) return {};
    return kit;
}

std::optional<Kit> Kit::acoustic(const std::string& folder, const std::string& microphone,
                                 const std::string& takes) {
    static constexpr const char* kNames[kPartCount] = {"ks", "sc", "ss", "ht", "hc", "ho",
                                                       "tl", "tm", "th", "",   ""};
    constexpr float kAttack = 0.1F;  // of the loudest sample
    Kit kit;
    kit.acoustic_ = true;
    for (const std::string& path : filesOf(folder)) {
        const std::string name = std::filesystem::path(path).stem().string();  // front_mic-ks_vl1_rr1
        const std::size_t at = microphone.size() + 1;
        if (!name.starts_with(microphone + "-") || name.size() < at + 7) continue;
        const auto part = std::find(std::begin(kNames), std::end(kNames), name.substr(at, 2));
        if (part == std::end(kNames) || takes.find(name.back()) == std::string::npos) continue;
        const auto layer = static_cast<std::size_t>(name[at + 5] - '1');
        auto& layers = kit.parts_[static_cast<std::size_t>(part - std::begin(kNames))];
        if (layers.size() <= layer) layers.resize(layer + 1);
        layers[layer].takes.push_back(loadSound(path, kAttack));
    }
    for (std::size_t part = 0; part < kCrash; ++part) {
        auto& layers = kit.parts_[part];
        std::erase_if(layers, [](const Layer& layer) { return layer.takes.empty(); });
        if (layers.empty()) return {};
    }
    kit.parts_[kCrash].push_back({{crash(1), crash(2)}});
    kit.parts_[kRide].push_back({{ride(1), ride(2), ride(3)}});
    return kit;
}

Stroke Kit::strokeFor(int pitch, int velocity, std::size_t count) const {
    const auto& layers = parts_[partFor(pitch)];
    if (layers.empty()) return {};
    const std::size_t layer =
        std::min(layers.size() - 1, static_cast<std::size_t>(velocity) * layers.size() / 128);
    const auto& takes = layers[layer].takes;
    const double power = layers.size() > 1 ? 0.75 : 1.5;  // The layers do the rest.
    return {&takes[count % takes.size()], static_cast<float>(0.5 * std::pow(velocity / 127.0, power))};
}

bool Kit::chokes(int pitch, int sounding) const {
    const Part part = partFor(pitch);
    return acoustic_ && partFor(sounding) == kOpenHat &&
           (part == kClosedHat || part == kPedalHat || part == kOpenHat);
}

Kit::Part Kit::partFor(int pitch) {
    switch (pitch) {
        case 35:
        case 36:
            return kKick;
        case 37:
            return kRim;
        case 22:
        case 42:
            return kClosedHat;
        case 44:
            return kPedalHat;
        case 26:
        case 46:
            return kOpenHat;
        case 41:
        case 43:
        case 45:
        case 58:
            return kLowTom;
        case 47:
            return kMiddleTom;
        case 48:
        case 50:
            return kHighTom;
        case 49:
        case 52:
        case 55:
        case 57:
            return kCrash;
        case 51:
        case 53:
        case 59:
            return kRide;
        default:
            return kSnare;
    }
}

}  // namespace qvct::bench
