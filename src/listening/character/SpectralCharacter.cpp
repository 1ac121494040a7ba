#include "listening/character/SpectralCharacter.h"

#include "listening/character/Emphasis.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>

namespace qvct {
namespace {

constexpr double kLowestRate = 2000;
constexpr double kLowestHertz = 20;
constexpr float kSilence = 1e-12F;  // energy of a window: 120 dB below full scale

// Where critical bands begin, in Hz; the last number is where the last one ends. E. Zwicker, JASA 33 (1961).
constexpr std::array<double, 25> kBarkEdges = {kLowestHertz, 100,  200,  300,  400,  510,   630,  770,  920,
                                               1080,         1270, 1480, 1720, 2000, 2320,  2700, 3150, 3700,
                                               4400,         5300, 6400, 7700, 9500, 12000, 15500};
constexpr std::size_t kWarmBands = 4;  // below 400 Hz

// What a band leaves in its neighbours: 27 dB less in the one below, 10 dB in the one above. After E.
// Terhardt, "Calculating virtual pitch", Hearing Research 1 (1979), for moderate levels.
constexpr double kToLower = 0.002;
constexpr double kToHigher = 0.1;
constexpr double kLoudnessExponent = 0.23;  // of energy. E. Zwicker, H. Fastl, "Psychoacoustics", chapter 8

constexpr std::size_t kFirstLag = 3;  // nearer bins are one tone's own, by the window
constexpr std::size_t kLagStep = 2;   // by which the window blurs, so that none is missed
constexpr std::size_t kLags = 6;      // to 140 Hz
constexpr double kRoughestHertz = 70;
constexpr std::size_t kRoughBands = 20;  // below 6.4 kHz, above which swings are hardly heard
constexpr double kAsper = 2.45;  // makes a tone of 1 kHz whose amplitude swings wholly at 70 Hz 1 asper

constexpr float kFloor = 1e-9F;  // of a window's energy: what is less in a bin counts as that much

Lanes orZero(Lanes::Vector value, decltype(Lanes::Vector{} > Lanes::Vector{}) condition) {
    return Lanes(condition ? value : Lanes::Vector{});
}

// How rough a modulation of so many Hz is, beside one of 70 Hz.
double roughnessAt(double hertz) {
    return hertz / kRoughestHertz * std::exp(1 - hertz / kRoughestHertz);
}

// Zwicker's specific loudness of each band, but for a factor.
std::vector<double> loudnessOf(std::vector<double> energies) {
    energies.resize(kBarkEdges.size() - 1);  // A low rate keeps nothing from spreading upwards.
    for (std::size_t b = energies.size(); b-- > 1;) energies[b - 1] += kToLower * energies[b];
    for (std::size_t b = 1; b < energies.size(); ++b) energies[b] += kToHigher * energies[b - 1];
    for (double& energy : energies) energy = std::pow(energy, kLoudnessExponent);
    return energies;
}

// By DIN 45692, the loudness of a band at z Bark weighs by this more.
double sharpnessWeight(double z) {
    return z < 15.8 ? 1 : 0.15 * std::exp(0.42 * (z - 15.8)) + 0.85;
}

}  // namespace

struct SpectralCharacter::Sums {
    std::vector<Lanes> powers;
    Lanes weight{0}, flatness{0}, roughness{0}, partials{0};
};

SpectralCharacter::SpectralCharacter(double sampleRate)
    : spectra_(sampleRate), powers_(spectra_.bins()), octaves_(spectra_.bins()) {
    if (sampleRate < kLowestRate) return;
    const double bin = spectra_.binHertz();
    const std::size_t last = spectra_.bins() - kFirstLag - kLagStep * kLags;
    const auto binAt = [&](double hertz) {
        return std::min(last, static_cast<std::size_t>(std::ceil(hertz / bin)));
    };
    for (std::size_t b = 0; b + 1 < kBarkEdges.size(); ++b) {
        const Band band{binAt(kBarkEdges[b]), binAt(kBarkEdges[b + 1])};
        if (band.begin < band.end) bands_.push_back(band);
    }
    for (std::size_t k = 1; k < octaves_.size(); ++k)
        octaves_[k] = static_cast<float>(std::log2(static_cast<double>(k) * bin));
    for (std::size_t i = 0; i < kLags; ++i) {
        const double weight = roughnessAt(static_cast<double>(kFirstLag + i * kLagStep) * bin);
        lagWeights_.push_back(static_cast<float>(weight * weight));
    }
    bandPowers_.resize(bands_.size());
    bandAmplitudes_.resize(bands_.size());
}

std::optional<SpectralMeasures> SpectralCharacter::measure(std::span<const float> samples, float mean) {
    if (bands_.empty()) return std::nullopt;
    Sums sums;
    sums.powers.assign(powers_.size(), Lanes(0));
    const std::size_t windows = spectra_.windowsOf(samples.size());
    for (std::size_t first = 0; first < windows; first += ShortTimeSpectra::kTogether)
        add(spectra_.at(samples, mean, first), sums);
    if (sumOf(sums.weight) <= 0) return std::nullopt;
    return measuresOf(sums);
}

void SpectralCharacter::add(std::span<const std::complex<Lanes>> bins, Sums& sums) {
    for (std::size_t k = bands_.front().begin - 1; k <= bands_.back().end; ++k)
        powers_[k] = bins[k].real() * bins[k].real() + bins[k].imag() * bins[k].imag();
    Lanes energy(0);
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        Lanes power(0);
        for (std::size_t k = bands_[b].begin; k < bands_[b].end; ++k) power += powers_[k];
        bandPowers_[b] = power;
        bandAmplitudes_[b] = squareRoot(power);
        energy += power;
    }
    energy = larger(energy, Lanes(kSilence));
    const Lanes weight = orZero(squareRoot(energy).v, energy.v > Lanes(kSilence).v);
    const Lanes scale = weight / energy;
    for (std::size_t k = bands_.front().begin; k < bands_.back().end; ++k)
        sums.powers[k] += powers_[k] * scale;
    sums.weight += weight;
    sums.flatness += weight * flatness(energy);
    sums.roughness += weight * roughness(bins, energy);
    sums.partials += weight * logPartials(energy);
}

// The geometric mean of the bins of two bands beside the arithmetic one, in octaves; the mean over all. Two,
// since a single one has too few bins at low frequencies to tell a tone from noise.
Lanes SpectralCharacter::flatness(Lanes energy) const {
    const Lanes scale = Lanes(1) / (energy * kFloor);
    Lanes sum(0), amplitudes(0);
    for (std::size_t b = 0; b < bands_.size(); b += 2) {
        const std::size_t last = std::min(b + 1, bands_.size() - 1);
        const std::size_t begin = bands_[b].begin, end = bands_[last].end;
        const float share = 1 / static_cast<float>(end - begin);
        Lanes logarithms(0);
        for (std::size_t k = begin; k < end; ++k) logarithms += roughLog2(Lanes(1) + powers_[k] * scale);
        const Lanes power = last > b ? bandPowers_[b] + bandPowers_[last] : bandPowers_[b];
        const Lanes amplitude = squareRoot(power);
        sum += amplitude * (logarithms * share - roughLog2(Lanes(1) + power * scale * share));
        amplitudes += amplitude;
    }
    return sum / larger(amplitudes, squareRoot(Lanes(kSilence)));
}

// The products of bins that are so far apart add up to how much the envelope of the band swings at the
// difference of their frequencies.
Lanes SpectralCharacter::roughness(std::span<const std::complex<Lanes>> bins, Lanes energy) const {
    Lanes sum(0), amplitudes(0);
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        amplitudes += bandAmplitudes_[b];
        if (b >= kRoughBands) continue;
        Lanes swing(0);
        for (std::size_t i = 0; i < kLags; ++i) {
            const std::complex<Lanes>* low = &bins[bands_[b].begin];
            const std::complex<Lanes>* high = low + kFirstLag + i * kLagStep;
            Lanes real(0), imaginary(0);
            for (std::size_t k = bands_[b].end - bands_[b].begin; k-- > 0; ++low, ++high) {
                real += low->real() * high->real() + low->imag() * high->imag();
                imaginary += low->real() * high->imag() - low->imag() * high->real();
            }
            swing += (real * real + imaginary * imaginary) * lagWeights_[i];
        }
        const Lanes power = bandPowers_[b] + energy * kFloor;
        Lanes reached = power;  // by the longest lag
        for (std::size_t above = b + 1; above < std::min(b + 3, bands_.size()); ++above)
            reached += bandPowers_[above];
        sum += bandAmplitudes_[b] * (swing / (power * reached));
    }
    return sum / larger(amplitudes, squareRoot(Lanes(kSilence)));
}

// (sum of amplitudes)^2 / sum of their squares: n for n partials of equal strength.
Lanes SpectralCharacter::logPartials(Lanes energy) const {
    Lanes amplitudes(0), squares(energy * kFloor);
    for (std::size_t k = bands_.front().begin; k < bands_.back().end; ++k) {
        const Lanes here = powers_[k], below = powers_[k - 1], above = powers_[k + 1];
        const Lanes square = orZero((here + below + above).v, (here.v > below.v) & (here.v >= above.v));
        amplitudes += squareRoot(square);
        squares += square;
    }
    return roughLog2(larger(Lanes(1), amplitudes * amplitudes / squares));
}

SpectralMeasures SpectralCharacter::measuresOf(const Sums& sums) const {
    double whole = 0, octaves = 0;
    std::vector<double> energies;
    for (const auto [begin, end] : bands_) {
        double energy = 0;
        for (std::size_t k = begin; k < end; ++k) {
            const double power = sumOf(sums.powers[k]);
            energy += power;
            octaves += power * octaves_[k];
        }
        energies.push_back(energy);
        whole += energy;
    }
    double loudness = 0, warm = 0, sharp = 0;
    energies = loudnessOf(std::move(energies));
    for (std::size_t b = 0; b < energies.size(); ++b) {
        const double z = static_cast<double>(b) + 0.5;
        loudness += energies[b];
        if (b < kWarmBands) warm += energies[b];
        sharp += energies[b] * z * sharpnessWeight(z);
    }
    const double weight = sumOf(sums.weight);
    const double decibels = 10 * std::numbers::ln2 / std::numbers::ln10;
    return {.sharpness = 0.11 * sharp / loudness,
            .warmth = warm / loudness,
            .roughness = kAsper * sumOf(sums.roughness) / weight,
            .flatness = decibels * sumOf(sums.flatness) / weight,
            .height = std::exp2(octaves / whole),
            .partials = std::exp2(sumOf(sums.partials) / weight)};
}

}  // namespace qvct
