#pragma once

#include <array>
#include <cmath>
#include <cstring>
#include <type_traits>

namespace qvct {

/// Four floats that are computed with at once, as if they were one; compilers use vector instructions for it.
struct Lanes {
    using Vector = float __attribute__((vector_size(16)));

    Lanes() = default;
    Lanes(float all) : v{all, all, all, all} {}  // NOLINT(google-explicit-constructor): stands in for a float
    Lanes(Vector lanes) : v(lanes) {}            // NOLINT(google-explicit-constructor)
    /// The first lane: lets code written for numbers take the cosine of a value that is the same in all
    /// lanes.
    operator float() const { return v[0]; }  // NOLINT(google-explicit-constructor)

    Lanes& operator+=(Lanes other) { return v += other.v, *this; }
    Lanes& operator-=(Lanes other) { return v -= other.v, *this; }
    Lanes& operator*=(Lanes other) { return v *= other.v, *this; }
    Lanes operator-() const { return Lanes(-v); }

    Vector v{};
};

inline Lanes operator+(Lanes a, Lanes b) {
    return Lanes(a.v + b.v);
}
inline Lanes operator-(Lanes a, Lanes b) {
    return Lanes(a.v - b.v);
}
inline Lanes operator*(Lanes a, Lanes b) {
    return Lanes(a.v * b.v);
}
inline Lanes operator/(Lanes a, Lanes b) {
    return Lanes(a.v / b.v);
}

template <typename Number>
requires std::is_arithmetic_v<Number> Lanes operator*(Number a, Lanes b) {
    return Lanes(static_cast<float>(a)) * b;
}
template <typename Number>
requires std::is_arithmetic_v<Number> Lanes operator*(Lanes a, Number b) {
    return a * Lanes(static_cast<float>(b));
}
template <typename Number>
requires std::is_arithmetic_v<Number> Lanes operator/(Lanes a, Number b) {
    return a / Lanes(static_cast<float>(b));
}

inline Lanes larger(Lanes a, Lanes b) {
    return Lanes(a.v > b.v ? a.v : b.v);
}

inline Lanes squareRoot(Lanes a) {
    Lanes roots;
    for (int i = 0; i < 4; ++i) roots.v[i] = std::sqrt(a.v[i]);
    return roots;
}

/// Four floats in a row, from any place.
inline Lanes lanesAt(const float* values) {
    Lanes lanes;
    std::memcpy(&lanes.v, values, sizeof lanes.v);
    return lanes;
}

/// What was lane i of row k becomes lane k of row i.
inline void transpose(std::array<Lanes, 4>& rows) {
    const auto low01 = __builtin_shufflevector(rows[0].v, rows[1].v, 0, 4, 1, 5);
    const auto high01 = __builtin_shufflevector(rows[0].v, rows[1].v, 2, 6, 3, 7);
    const auto low23 = __builtin_shufflevector(rows[2].v, rows[3].v, 0, 4, 1, 5);
    const auto high23 = __builtin_shufflevector(rows[2].v, rows[3].v, 2, 6, 3, 7);
    rows[0] = Lanes(__builtin_shufflevector(low01, low23, 0, 1, 4, 5));
    rows[1] = Lanes(__builtin_shufflevector(low01, low23, 2, 3, 6, 7));
    rows[2] = Lanes(__builtin_shufflevector(high01, high23, 0, 1, 4, 5));
    rows[3] = Lanes(__builtin_shufflevector(high01, high23, 2, 3, 6, 7));
}

/// Binary logarithm to about 0.006, for finite values of at least 1.
inline Lanes roughLog2(Lanes x) {
    using Bits = int __attribute__((vector_size(16)));
    const Bits bits = reinterpret_cast<Bits>(x.v);
    const Lanes exponent(__builtin_convertvector((bits >> 23) - 127, Lanes::Vector));
    const Lanes mantissa(reinterpret_cast<Lanes::Vector>((bits & 0x7FFFFF) | 0x3F800000));
    return exponent + (Lanes(2) - Lanes(0.33582878F) * mantissa) * mantissa - Lanes(1.65871022F);
}

}  // namespace qvct
