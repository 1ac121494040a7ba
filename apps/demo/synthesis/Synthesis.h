#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <vector>

/// The few building blocks that every voice of the demonstration library is made of. Frequencies are in
/// hertz, times in seconds, levels linear with full scale at 1.
namespace qvct::demo {

/// One channel of audio.
using Signal = std::vector<double>;

double hertzOfKey(double midiKey);

/// An exponential decay that has fallen to 1/e after `seconds`.
double decayed(double time, double seconds);

std::size_t framesIn(double seconds, int rate);

/// White noise; the same seed gives the same noise on every machine.
class Noise {
  public:
    explicit Noise(std::uint32_t seed) : state_(seed * 2654435761U + 1) {}
    /// In [-1, 1).
    double next();

  private:
    std::uint32_t state_;
};

/// A saw-tooth or square whose steps are rounded off so that they hardly alias (polynomial band-limited
/// step).
class Oscillator {
  public:
    Oscillator(int rate, double phase) : rate_(rate), phase_(phase) {}
    double saw(double hertz);
    double square(double hertz);

  private:
    /// Moves on; the phase before, in [0, 1).
    double advance(double hertz);
    static double roundedStep(double phase, double increment);

    double rate_;
    double phase_;
    double increment_ = 0;
};

/// A two-pole state-variable filter that stays stable while its frequency is swept.
class Filter {
  public:
    explicit Filter(int rate) : rate_(rate) {}
    void tune(double hertz, double quality);
    /// Takes one sample in; the three outputs are then current.
    void feed(double sample);
    double low() const { return low_; }
    double band() const { return band_; }
    double high() const { return high_; }

  private:
    double rate_;
    double coefficient_ = 0, damping_ = 1;
    double state1_ = 0, state2_ = 0;
    double low_ = 0, band_ = 0, high_ = 0;
};

/// Keeps what lies between two frequencies, in place.
void passBand(Signal& signal, int rate, double lowCut, double highCut);

/// Overdrives (1 = not at all), in place; the peak stays where it is.
void drive(Signal& signal, double amount);

/// Fades the last `seconds` out, so that a sound cut short does not click.
void fadeOut(Signal& signal, int rate, double seconds);

}  // namespace qvct::demo
