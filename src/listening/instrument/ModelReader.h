#pragma once

#include "listening/instrument/NetworkLayer.h"
#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Takes a model's parts from the bytes of its file, one after the other. After the first fault everything is
/// empty or 0, so that it is enough to ask for it at the end; nothing larger than the file is ever made.
class ModelReader {
  public:
    explicit ModelReader(std::span<const std::uint8_t> bytes) : bytes_(bytes) {}

    bool isSound() const { return fault_.empty(); }
    /// A fault unless something holds; the first one counts.
    void expect(bool holds, const char* otherwise);
    void expectEnd() { expect(at_ == bytes_.size(), "goes on after the model's end"); }
    /// Whether all was sound; if not, the error tells the fault and its offset.
    bool report(Error* error) const;

    /// The four bytes of a kind of file, its version, and the features that it was made for.
    void head(std::string_view magic, std::uint32_t format, const char* otherwise);
    std::uint32_t number();
    /// A number from 1 to `most`.
    std::size_t count(std::size_t most);
    /// A number of at most a million, finite.
    float real();
    std::vector<float> reals(std::size_t count);
    std::string text();
    /// A byte below `end`.
    std::size_t index(std::size_t end, const char* otherwise);
    Standardisation standardisation();
    /// Its number of outputs, their scales and biases, and a byte for each weight.
    NetworkLayer layer(std::size_t inputs);
    /// So many bytes, or none.
    std::span<const std::uint8_t> take(std::size_t size);

  private:
    std::span<const std::uint8_t> bytes_;
    std::size_t at_ = 0;
    std::string fault_;
};

}  // namespace qvct
