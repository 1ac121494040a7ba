#include "listening/Listener.h"

#include "listening/character/Loudness.h"
#include "listening/character/SoundCharacter.h"
#include "listening/character/TruePeak.h"
#include "listening/instrument/InstrumentModel.h"
#include "listening/instrument/LoopMeasures.h"
#include "listening/instrument/SoundFeatures.h"
#include "listening/likeness/Fingerprinter.h"
#include "listening/likeness/LikenessModel.h"
#include "listening/likeness/LoopLikeness.h"
#include "listening/onsets/OnsetDetector.h"
#include "listening/pitch/LoopKey.h"
#include "listening/pitch/NotePitch.h"
#include "listening/sound/SoundExcerpt.h"
#include "listening/tempo/LoopTempo.h"
#include "media/audio/AudioDecoder.h"

#include <algorithm>
#include <cmath>
#include <optional>
#include <utility>
#include <vector>

namespace qvct {
namespace {

constexpr std::size_t kBlock = 8192;
/// Shorter sounds have one beginning.
constexpr double kShortestLoop = 0.75;
constexpr double kEven = 0.5;

bool isLoop(const HeardSound& sound) {
    return sound.loopConfidence.value_or(0) > kEven;
}

}  // namespace

struct Listener::Analysers {
    ListeningModels models;
    CharacterMeter character;
    NotePitchDetector note;
    LoopKeyDetector key;
    double lastRate = 0;  // which those two are for
    std::optional<SoundFeatures> features;
    std::optional<Fingerprinter> fingerprinter;

    // Of the sound at hand.
    std::optional<SoundExcerpt> excerpt;
    std::optional<OnsetDetector> detector;
    std::vector<Onset> onsets;
    double rate = 1;
    bool hasOneChannel = true;

    void begin(double sampleRate, int channels, std::int64_t frames) {
        rate = sampleRate;
        hasOneChannel = channels == 1;
        if (excerpt)
            excerpt->restart(sampleRate, channels);
        else
            excerpt.emplace(sampleRate, channels, kMostSeconds);
        detector.reset();
        if (static_cast<double>(frames) >= kShortestLoop * sampleRate) detector.emplace(sampleRate, channels);
    }
    bool process(std::span<const float> frames) {
        if (detector) detector->process(frames);
        return excerpt->process(frames);
    }

    std::vector<Onset> onsetsOfExcerpt() const;
    void addCharacter(HeardSound& sound);
    void addKind(HeardSound& sound) const;
    void prepareFor(double excerptRate);
    void addInstrument(HeardSound& sound);
    void addLoopLikeness(HeardSound& sound);
    void addNote(HeardSound& sound);
    void addKey(HeardSound& sound);
    void addTempo(HeardSound& sound);
};

void Listener::Analysers::addCharacter(HeardSound& sound) {
    // Two channels that are the same are louder than one.
    const auto right = hasOneChannel ? std::span<const float>() : excerpt->right();
    sound.loudness = integratedLoudness(excerpt->left(), right, excerpt->sampleRate());
    sound.truePeak = truePeak(excerpt->left(), right);
    const auto its =
        character.measure(excerpt->left(), excerpt->right(), excerpt->mono(), excerpt->sampleRate());
    if (!its) return;
    for (std::size_t i = 0; i < kCharacterScales; ++i) {
        const CharacterScale scale = characterScale(i);
        sound.traits.push_back({nameOf(scale), (*its)[scale].level, measureOf(scale), (*its)[scale].measure});
    }
}

std::vector<Onset> Listener::Analysers::onsetsOfExcerpt() const {
    std::vector<Onset> its = onsets;
    for (Onset& onset : its) {
        const double frames = static_cast<double>(onset.frame - excerpt->begin()) * excerpt->sampleRate();
        onset.frame = std::max<std::int64_t>(0, static_cast<std::int64_t>(frames / rate));
    }
    return its;
}

void Listener::Analysers::addKind(HeardSound& sound) const {
    if (sound.seconds < kShortestLoop) {
        sound.loopConfidence = 0;
        return;
    }
    const auto positions = framesOf(onsetsOfExcerpt());
    sound.loopConfidence = LoopMeasures::of(excerpt->mono(), excerpt->sampleRate(), positions).likelihood();
}

void Listener::Analysers::prepareFor(double excerptRate) {
    if (lastRate == excerptRate) return;
    lastRate = excerptRate;
    fingerprinter.emplace(excerptRate);
    features.reset();
    if (excerptRate >= SoundFeatures::kLowestRate) features.emplace(excerptRate);
}

/// What plays in a single sound, and what that is like.
void Listener::Analysers::addInstrument(HeardSound& sound) {
    if (!features || (!models.instrument && !models.likeness)) return;
    const auto values = features->of(excerpt->mono());
    if (models.likeness) sound.likeness = models.likeness->of(values);
    if (!models.instrument) return;
    const auto judgement = models.instrument->judge(values);
    if (!judgement) return;
    sound.instruments.push_back({std::string(judgement->label), judgement->confidence});
    if (judgement->familyLabel != judgement->label)
        sound.instruments.push_back({std::string(judgement->familyLabel), judgement->familyConfidence});
}

void Listener::Analysers::addLoopLikeness(HeardSound& sound) {
    if (!features || !models.likeness) return;
    sound.likeness = likenessOfLoop(excerpt->mono(), excerpt->sampleRate(), onsetsOfExcerpt(), *features,
                                    *models.likeness);
}

void Listener::Analysers::addNote(HeardSound& sound) {
    if (const auto pitch = note.pitchOf(excerpt->mono(), excerpt->sampleRate()))
        sound.note = {pitch->note, pitch->cents, pitch->confidence};
}

void Listener::Analysers::addKey(HeardSound& sound) {
    if (const auto its = key.keyOf(excerpt->mono(), excerpt->sampleRate()))
        sound.key = {its->tonic, its->mode == LoopKey::Mode::kMinor, its->confidence};
}

/// Of a loop that was heard to its end: its length tells most. A little silence at its beginning is part of
/// it, more is not.
void Listener::Analysers::addTempo(HeardSound& sound) {
    constexpr double kMostSilence = 0.05;
    if (sound.isCut) return;
    const bool isLate = static_cast<double>(excerpt->begin()) > kMostSilence * rate;
    const std::int64_t begin = isLate ? excerpt->begin() : 0;
    const std::int64_t frames = excerpt->begin() - begin + std::llround(sound.seconds * rate);
    std::vector<Onset> its = onsets;
    for (Onset& onset : its) onset.frame -= begin;
    for (const auto& tempo : LoopTempo::of(its, frames, rate).candidates)
        sound.tempos.push_back({tempo.bpm, tempo.beats, tempo.confidence});
}

Listener::Listener(ListeningModels models) : its_(std::make_unique<Analysers>()) {
    its_->models = std::move(models);
}

Listener::~Listener() = default;

const SoundExcerpt& Listener::excerpt() const {
    return *its_->excerpt;
}

HeardSound Listener::listen(AudioDecoder& decoder) {
    const int channels = decoder.channels();
    its_->begin(decoder.sampleRate(), channels, decoder.frames());
    const auto width = static_cast<std::size_t>(channels);
    std::vector<float> block(std::max(kBlock / width, std::size_t{1}) * width);
    std::size_t frames = 0;
    do {
        frames = decoder.read(block);
    } while (frames > 0 && its_->process(std::span(block).first(frames * width)));
    return judge();
}

HeardSound Listener::listen(std::span<const float> samples, double sampleRate, int channels) {
    const auto width = static_cast<std::size_t>(channels);
    const std::size_t frames = samples.size() / width;
    its_->begin(sampleRate, channels, static_cast<std::int64_t>(frames));
    its_->process(samples.first(frames * width));
    return judge();
}

HeardSound Listener::judge() {
    SoundExcerpt& excerpt = *its_->excerpt;
    excerpt.finish();
    HeardSound sound;
    sound.seconds = excerpt.seconds();
    sound.isCut = excerpt.isCut();
    sound.isStereo = excerpt.isStereo();
    sound.sampleRate = its_->rate;
    its_->onsets = its_->detector ? its_->detector->finishWithLoudness() : std::vector<Onset>();
    sound.onsets = framesOf(its_->onsets);
    if (excerpt.mono().empty()) return sound;
    its_->addCharacter(sound);
    if (sound.traits.empty()) return sound;  // too little to hear anything in, or a constant
    its_->addKind(sound);
    its_->prepareFor(excerpt.sampleRate());
    sound.fingerprint = its_->fingerprinter->of(excerpt.mono());
    if (isLoop(sound)) {
        its_->addLoopLikeness(sound);
    } else {
        its_->addInstrument(sound);
        its_->addNote(sound);
    }
    if (sound.loopConfidence.value_or(1) >= kEven) {
        its_->addKey(sound);
        its_->addTempo(sound);
    }
    return sound;
}

}  // namespace qvct
