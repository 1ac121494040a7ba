#include "listening/instrument/SoundFeatures.h"

#include "listening/instrument/EnvelopeShape.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>
#include <numeric>

namespace qvct {
namespace {

// Low bands need long frames, which are cheap at a low rate; high ones are told apart in time.
constexpr double kLowRate = 5512;
constexpr double kLowFrame = 0.0464, kHighFrame = 0.0116;
constexpr std::size_t kLowOverlap = 8, kHighOverlap = 2;
constexpr std::size_t kLowBands = 10, kHighBands = 20;
constexpr double kSplit = 370, kHighest = 18'000;

// The ends of the picture's columns, in seconds.
constexpr std::array kColumns{0.0,   0.006, 0.012, 0.018, 0.026, 0.038, 0.055, 0.08,
                              0.115, 0.165, 0.24,  0.34,  0.5,   0.72,  1.05,  2.0};
constexpr std::size_t kColumnCount = kColumns.size() - 1;
constexpr float kFloor = 1e-7F;    // -70 dB
constexpr float kAttack = 0.03F;   // of the peak: where a sound is taken to begin
constexpr float kSilence = 1e-5F;  // -100 dB of full scale
constexpr double kLowest = 20;     // Hz
constexpr float kNothing = 1e-20F;
constexpr float kMostOffset = 0.1F;  // of the peak
constexpr std::array kDrops{0.1F, 0.01F, 0.001F};
constexpr std::array kGlide{0.006, 0.018, 0.035, 0.06, 0.09, 0.14, 0.22};  // seconds
constexpr std::size_t kSpectrumValues = 9, kCrossings = 4;

std::vector<double> lowEdges() {
    return {32, 48, 64, 82, 104, 130, 162, 200, 248, 304, kSplit};
}

std::vector<double> highEdges() {
    std::vector<double> edges;
    for (std::size_t i = 0; i <= kHighBands; ++i) {
        const double step = static_cast<double>(i) / static_cast<double>(kHighBands);
        edges.push_back(kSplit * std::pow(kHighest / kSplit, step));
    }
    return edges;
}

float decibels(float power) {
    return std::log10(std::max(power, kFloor));
}

float logTime(double seconds) {
    return static_cast<float>(std::log2(seconds + 0.004) + 4);
}

// The mean of a band's frames in a column; of a column between two frames, the nearer frame.
float meanIn(const BandPicture& picture, std::size_t band, double from, double end) {
    const auto frameAt = [&](double seconds) {
        return static_cast<std::size_t>(std::lround(seconds * picture.framesPerSecond()));
    };
    const std::size_t first = frameAt(from);
    const std::size_t last = std::min(std::max(first + 1, frameAt(end)), picture.frames());
    if (first >= last) return 0;
    float sum = 0;
    for (std::size_t i = first; i < last; ++i) sum += picture.frame(i)[band];
    return sum / static_cast<float>(std::max(first + 1, frameAt(end)) - first);
}

}  // namespace

SoundFeatures::SoundFeatures(double sampleRate)
    : rate_(sampleRate),
      decimator_(sampleRate, kLowRate),
      low_(decimator_.sampleRate(), kLowFrame, kLowOverlap, lowEdges()),
      high_(sampleRate, kHighFrame, kHighOverlap, highEdges()),
      partials_(sampleRate) {}

std::size_t SoundFeatures::count() {
    constexpr std::size_t kBands = kLowBands + kHighBands;
    return kBands * kColumnCount + kBands * (1 + kDrops.size()) + 2 * kGlide.size() +
           kSpectrumValues * BandPicture::kParts.size() + kCrossings + EnvelopeShape::kValues +
           PartialTones::kValues;
}

// Without what is too low to be heard: converters of early samplers are off the middle, which would hide
// where a sound begins and ends. What the first sample is off by is taken to have been so before, unless it
// is much.
std::span<const float> SoundFeatures::centred(std::span<const float> samples) {
    float peak = 0;
    for (const float sample : samples) peak = std::max(peak, std::abs(sample));
    const auto share = static_cast<float>(1 - std::exp(-2 * std::numbers::pi * kLowest / rate_));
    float offset = samples.empty() ? 0 : std::clamp(samples.front(), -kMostOffset * peak, kMostOffset * peak);
    centred_.resize(samples.size());
    for (std::size_t i = 0; i < samples.size(); ++i) {
        offset += share * (samples[i] - offset);
        if (std::abs(offset) < kNothing) offset = 0;  // numbers smaller than normal ones are slow
        centred_[i] = samples[i] - offset;
    }
    return centred_;
}

std::span<const float> SoundFeatures::soundIn(std::span<const float> samples) const {
    float peak = 0;
    for (const float sample : samples) peak = std::max(peak, std::abs(sample));
    if (peak < kSilence) return {};
    const auto attack = std::find_if(samples.begin(), samples.end(),
                                     [&](float sample) { return std::abs(sample) >= kAttack * peak; });
    const auto sound = samples.subspan(static_cast<std::size_t>(attack - samples.begin()));
    return sound.first(std::min(sound.size(), static_cast<std::size_t>(kMostSeconds * rate_)));
}

std::vector<float> SoundFeatures::of(std::span<const float> samples) {
    const auto sound = soundIn(centred(samples));
    if (sound.empty()) return {};
    const auto measure = [this](BandPicture& picture, std::span<const float> part) {
        padded_.assign(picture.lead(), 0);
        padded_.insert(padded_.end(), part.begin(), part.end());
        padded_.resize(padded_.size() + picture.trail(), 0);
        picture.measure(padded_);
    };
    lower_.clear();
    decimator_.append(sound, lower_);
    measure(low_, lower_);
    measure(high_, sound);

    std::vector<float> values;
    values.reserve(count());
    appendPicture(values);
    appendBands(low_, values);
    appendBands(high_, values);
    appendGlide(values);
    appendSpectra(values);
    appendCrossings(sound, values);
    EnvelopeShape::append(sound, rate_, values);
    partials_.append(sound, values);
    for (float& value : values) value = std::isfinite(value) ? std::clamp(value, -20.0F, 20.0F) : 0;
    return values;
}

// Levels of all bands in all columns, below that of the loudest column.
void SoundFeatures::appendPicture(std::vector<float>& values) const {
    std::array<std::array<float, kLowBands + kHighBands>, kColumnCount> picture{};
    float loudest = 1e-20F;
    for (std::size_t c = 0; c < kColumnCount; ++c) {
        for (std::size_t b = 0; b < kLowBands; ++b)
            picture[c][b] = meanIn(low_, b, kColumns[c], kColumns[c + 1]);
        for (std::size_t b = 0; b < kHighBands; ++b)
            picture[c][kLowBands + b] = meanIn(high_, b, kColumns[c], kColumns[c + 1]);
        loudest = std::max(loudest, std::accumulate(picture[c].begin(), picture[c].end(), 0.0F));
    }
    for (const auto& column : picture) {
        for (const float power : column) values.push_back(decibels(power / loudest));
    }
}

// Of each band: the highest level, beside that of all bands, and how long it stays near it.
void SoundFeatures::appendBands(const BandPicture& picture, std::vector<float>& values) const {
    float loudest = 1e-20F;
    for (std::size_t i = 0; i < picture.frames(); ++i) {
        for (const float power : picture.frame(i)) loudest = std::max(loudest, power);
    }
    for (std::size_t b = 0; b < picture.bands(); ++b) {
        std::size_t peak = 0;
        for (std::size_t i = 1; i < picture.frames(); ++i)
            if (picture.frame(i)[b] > picture.frame(peak)[b]) peak = i;
        const float highest = picture.frame(peak)[b];
        values.push_back(decibels(highest / loudest));
        for (const float drop : kDrops) {
            std::size_t end = peak;
            while (end < picture.frames() && picture.frame(end)[b] > drop * highest) ++end;
            values.push_back(logTime(static_cast<double>(end - peak) / picture.framesPerSecond()));
        }
    }
}

// Where the low bands' middle lies as time goes on, in octaves above 100 Hz, and how loud they are together.
void SoundFeatures::appendGlide(std::vector<float>& values) const {
    static const std::vector<double> kEdges = lowEdges();
    float loudest = 1e-20F;
    for (std::size_t i = 0; i < low_.frames(); ++i) {
        const auto frame = low_.frame(i);
        loudest = std::max(loudest, std::accumulate(frame.begin(), frame.end(), 0.0F));
    }
    for (const double moment : kGlide) {
        const auto index = static_cast<std::size_t>(std::lround(moment * low_.framesPerSecond()));
        float sum = 0, middle = 0;
        for (std::size_t b = 0; index < low_.frames() && b < kLowBands; ++b) {
            const float power = low_.frame(index)[b];
            sum += power;
            middle += power * static_cast<float>(std::log2((kEdges[b] + kEdges[b + 1]) / 200));
        }
        values.push_back(sum > 0 ? middle / sum : 0);
        values.push_back(decibels(sum / loudest));
    }
}

// Middle, width and 85 % point of each part's spectrum, how flat it is in four regions, and its share of high
// and low energy.
void SoundFeatures::appendSpectra(std::vector<float>& values) const {
    constexpr std::array kRegions{300.0, 1200.0, 4000.0, 9000.0, 18'000.0};
    for (std::size_t part = 0; part < BandPicture::kParts.size(); ++part) {
        const auto powers = high_.meanSpectrum(part);
        const double total = std::accumulate(powers.begin() + 1, powers.end(), 1e-20);
        double middle = 0, square = 0, sum = 0, rolloff = 0;
        for (std::size_t i = 1; i < powers.size(); ++i) {
            const double octave = std::log2(static_cast<double>(i) * high_.binWidth() / 1000);
            const double share = static_cast<double>(powers[i]) / total;
            middle += share * octave;
            square += share * octave * octave;
            if ((sum += share) < 0.85) rolloff = octave;
        }
        values.push_back(static_cast<float>(middle));
        values.push_back(static_cast<float>(std::sqrt(std::max(0.0, square - middle * middle))));
        values.push_back(static_cast<float>(rolloff));
        for (std::size_t r = 0; r + 1 < kRegions.size(); ++r) {
            const auto binOf = [&](double hertz) {
                return std::min(powers.size(), static_cast<std::size_t>(hertz / high_.binWidth()));
            };
            const std::size_t first = binOf(kRegions[r]), end = binOf(kRegions[r + 1]);
            double mean = 0, logs = 0;
            for (std::size_t i = first; i < end; ++i) {
                mean += static_cast<double>(powers[i]);
                logs += std::log(static_cast<double>(powers[i]) + 1e-12 * total);
            }
            const auto bins = static_cast<double>(std::max<std::size_t>(1, end - first));
            const double flatness = end > first ? logs / bins - std::log(mean / bins + 1e-12 * total) : 0;
            values.push_back(static_cast<float>(flatness / 2));
            if (r % 2 == 1) values.push_back(decibels(static_cast<float>(mean / total)));
        }
    }
}

// How often the signal crosses zero, in octaves above 1 kHz: in the attack, the body and later.
void SoundFeatures::appendCrossings(std::span<const float> sound, std::vector<float>& values) const {
    constexpr std::array<double, kCrossings + 1> kEnds{0, 0.01, 0.04, 0.12, 0.4};
    for (std::size_t part = 0; part < kCrossings; ++part) {
        const auto first = static_cast<std::size_t>(kEnds[part] * rate_) + 1;
        const auto end = std::min(sound.size(), static_cast<std::size_t>(kEnds[part + 1] * rate_));
        std::size_t crossings = 0;
        for (std::size_t i = first; i < end; ++i) crossings += (sound[i] < 0) != (sound[i - 1] < 0) ? 1 : 0;
        const double perSecond =
            end > first ? static_cast<double>(crossings) * rate_ / static_cast<double>(end - first) : 0;
        values.push_back(static_cast<float>(std::log2((perSecond + 40) / 2000)));
    }
}

}  // namespace qvct
