#include "listening/instrument/ModelReader.h"

#include "listening/instrument/SoundFeatures.h"

#include <algorithm>
#include <bit>
#include <cmath>

namespace qvct {
namespace {

constexpr std::size_t kMostUnits = 4096;
constexpr float kLargest = 1e6F;  // of any number in the file

}  // namespace

void ModelReader::expect(bool holds, const char* otherwise) {
    if (!holds && isSound()) fault_ = otherwise;
}

bool ModelReader::report(Error* error) const {
    return isSound() || fail(error, kErrorMalformed, fault_, {.offset = at_});
}

void ModelReader::head(std::string_view magic, std::uint32_t format, const char* otherwise) {
    const auto letters = take(magic.size());
    expect(std::equal(letters.begin(), letters.end(), magic.begin()), otherwise);
    expect(number() == format, "is of another version of the format");
    expect(number() == SoundFeatures::kVersion && number() == SoundFeatures::count(),
           "was made for other features");
}

std::uint32_t ModelReader::number() {
    const auto four = take(4);
    return four.empty() ? 0
                        : four[0] | std::uint32_t{four[1]} << 8U | std::uint32_t{four[2]} << 16U |
                              std::uint32_t{four[3]} << 24U;
}

std::size_t ModelReader::count(std::size_t most) {
    const std::size_t value = number();
    expect(value >= 1 && value <= most, "has a count out of bounds");
    return isSound() ? value : 0;
}

float ModelReader::real() {
    const float value = std::bit_cast<float>(number());
    expect(std::abs(value) <= kLargest, "has a number that is not finite or too large");
    return isSound() ? value : 0;
}

std::vector<float> ModelReader::reals(std::size_t count) {
    expect(count <= (bytes_.size() - at_) / 4, "is cut off");
    std::vector<float> values(isSound() ? count : 0);
    for (float& value : values) value = real();
    return values;
}

std::string ModelReader::text() {
    const auto length = take(1);
    const auto letters = take(length.empty() ? 0 : length[0]);
    return std::string(letters.begin(), letters.end());
}

std::size_t ModelReader::index(std::size_t end, const char* otherwise) {
    const auto byte = take(1);
    expect(!byte.empty() && byte[0] < end, otherwise);
    return isSound() ? byte[0] : 0;
}

Standardisation ModelReader::standardisation() {
    Standardisation made;
    made.means = reals(SoundFeatures::count());
    made.scales = reals(SoundFeatures::count());
    return made;
}

NetworkLayer ModelReader::layer(std::size_t inputs) {
    NetworkLayer made{inputs, count(kMostUnits), {}, {}};
    const auto scales = reals(made.outputs);
    made.biases = reals(made.outputs);
    const auto weights = take(made.inputs * made.outputs);
    made.weights.resize(weights.size());
    for (std::size_t i = 0; i < weights.size(); ++i)
        made.weights[i] = static_cast<float>(static_cast<std::int8_t>(weights[i])) * scales[i % made.outputs];
    return made;
}

std::span<const std::uint8_t> ModelReader::take(std::size_t size) {
    expect(size <= bytes_.size() - at_, "is cut off");
    if (!isSound()) return {};
    at_ += size;
    return bytes_.subspan(at_ - size, size);
}

}  // namespace qvct
