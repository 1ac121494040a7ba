#include "listening/instrument/EnvelopeShape.h"

#include <algorithm>
#include <array>
#include <cmath>

namespace qvct {
namespace {

constexpr double kStepsPerSecond = 1000;
constexpr float kFloor = 1e-6F;                                       // of the highest level: -60 dB
constexpr std::array kDrops{3.0F, 6.0F, 12.0F, 20.0F, 30.0F, 45.0F};  // dB below the highest level
constexpr std::array kMoments{0.005, 0.01, 0.02, 0.035, 0.06, 0.1, 0.2, 0.4, 0.8};  // seconds after it
constexpr std::array kFlutters{2, 4, 8, 16, 32, 64};  // steps: half the waves that are told apart
constexpr double kStrokes = 0.08;                     // seconds in which a clap has all its hands
constexpr float kStroke = 3.0F;                       // dB that a stroke rises above what was before

// Mean power of each step, in dB below the highest.
class Levels {
  public:
    Levels(std::span<const float> samples, double sampleRate)
        : step_(
              std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(sampleRate / kStepsPerSecond)))),
          stepsPerSecond_(sampleRate / static_cast<double>(step_)) {
        for (std::size_t at = 0; at < samples.size(); at += step_) {
            const auto run = samples.subspan(at, std::min(step_, samples.size() - at));
            float sum = 0;
            for (const float sample : run) sum += sample * sample;
            decibels_.push_back(sum / static_cast<float>(step_));
        }
        const auto highest = std::max_element(decibels_.begin(), decibels_.end());
        peak_ = static_cast<std::size_t>(highest - decibels_.begin());
        const float power = std::max(*highest, 1e-30F);
        for (float& level : decibels_) level = 10 * std::log10(std::max(level / power, kFloor));
    }

    std::span<const float> decibels() const { return decibels_; }
    std::size_t peak() const { return peak_; }
    double seconds(std::size_t steps) const { return static_cast<double>(steps) / stepsPerSecond_; }
    std::size_t steps(double seconds) const { return static_cast<std::size_t>(seconds * stepsPerSecond_); }
    /// The level some time after the highest one; the lowest where the sound has ended.
    float after(double seconds) const { return at(peak_ + steps(seconds)); }
    float at(std::size_t step) const {
        if (step >= decibels_.size()) return 10 * std::log10(kFloor);
        const std::size_t end = std::min(decibels_.size(), step + 3);
        float sum = 0;
        for (std::size_t i = step; i < end; ++i) sum += decibels_[i];
        return sum / static_cast<float>(end - step);
    }

  private:
    std::size_t step_;
    double stepsPerSecond_;
    std::size_t peak_ = 0;
    std::vector<float> decibels_;
};

float logTime(double seconds) {
    return static_cast<float>(std::log2(seconds + 0.001) + 5);
}

void appendDecay(const Levels& levels, std::vector<float>& values) {
    const auto decibels = levels.decibels();
    for (const float drop : kDrops) {
        std::size_t last = levels.peak();
        for (std::size_t i = levels.peak(); i < decibels.size(); ++i)
            if (decibels[i] > -drop) last = i;
        values.push_back(logTime(levels.seconds(last - levels.peak())));
    }
    for (const double moment : kMoments) values.push_back(levels.after(moment) / 10);
}

// The centre of the energy, and how much of it lies in the highest step.
void appendBalance(const Levels& levels, std::vector<float>& values) {
    const auto decibels = levels.decibels();
    double sum = 0, moment = 0;
    for (std::size_t i = 0; i < decibels.size(); ++i) {
        const double power = std::pow(10.0, static_cast<double>(decibels[i]) / 10);
        sum += power;
        moment += power * levels.seconds(i);
    }
    values.push_back(logTime(moment / sum));
    values.push_back(static_cast<float>(std::log2(sum) / 4));
}

// Rises out of a dip, one after the other: the hands of a clap, the grains of a shaker.
void appendStrokes(const Levels& levels, std::vector<float>& values) {
    const auto decibels = levels.decibels().first(std::min(levels.decibels().size(), levels.steps(kStrokes)));
    float strokes = 0, rise = 0, low = 0;
    std::size_t latest = 0;
    bool falling = true;
    float high = -1000;
    for (std::size_t i = 0; i < decibels.size(); ++i) {
        const float level = levels.at(i);
        if (falling) low = i == 0 ? level - 60 : std::min(low, level);
        if (falling && level > low + kStroke && level > -25) {
            strokes += 1;
            if (strokes > 1) rise += level - low;
            latest = i;
            falling = false;
            high = level;
        }
        if (!falling) {
            high = std::max(high, level);
            if (level < high - kStroke) {
                falling = true;
                low = level;
            }
        }
    }
    values.push_back(strokes / 2);
    values.push_back(rise / 10);
    values.push_back(logTime(levels.seconds(latest)));
}

// How far the level strays, on average, from the middle of its neighbours at several distances.
void appendFlutter(const Levels& levels, std::vector<float>& values) {
    const auto decibels = levels.decibels();
    for (const int distance : kFlutters) {
        const auto reach = static_cast<std::size_t>(distance);
        float sum = 0;
        std::size_t count = 0;
        for (std::size_t i = levels.peak() + reach; i + reach < decibels.size(); ++i) {
            if (decibels[i] < -40) continue;
            sum += std::abs(decibels[i] - (decibels[i - reach] + decibels[i + reach]) / 2);
            ++count;
        }
        values.push_back(count == 0 ? 0 : sum / static_cast<float>(count) / 3);
    }
}

float attackSeconds(const Levels& levels, float below) {
    std::size_t first = levels.peak();
    while (first > 0 && levels.decibels()[first - 1] > below) --first;
    return static_cast<float>(levels.seconds(levels.peak() - first));
}

}  // namespace

void EnvelopeShape::append(std::span<const float> samples, double sampleRate, std::vector<float>& values) {
    const Levels levels(samples, sampleRate);
    values.push_back(logTime(static_cast<double>(attackSeconds(levels, -3))));
    values.push_back(logTime(static_cast<double>(attackSeconds(levels, -10))));
    values.push_back(logTime(levels.seconds(levels.peak())));
    appendDecay(levels, values);
    appendBalance(levels, values);
    appendStrokes(levels, values);
    appendFlutter(levels, values);
    values.push_back(logTime(levels.seconds(levels.decibels().size())));
    values.push_back(levels.at(levels.decibels().size() * 9 / 10) / 10);
}

}  // namespace qvct
