#pragma once

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <span>
#include <string>

#include <unistd.h>

namespace qvct::bench {

/// An empty file of its own, gone with this object.
class TemporaryFile {
  public:
    TemporaryFile() { ::close(::mkstemp(path_.data())); }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;
    ~TemporaryFile() { ::unlink(path_.c_str()); }
    const std::string& path() const { return path_; }

  private:
    std::string path_ = "/tmp/qvct-bench-XXXXXX";
};

/// Writes 16-bit samples in [-1, 1], interleaved.
inline void writeWav(const std::string& path, std::span<const float> samples, std::uint32_t rate,
                     std::uint16_t channels) {
    std::ofstream file(path, std::ios::binary);
    const auto put = [&file](std::uint32_t value, int bytes) {
        for (int i = 0; i < bytes; ++i) file.put(static_cast<char>(value >> (8 * i)));
    };
    const auto size = static_cast<std::uint32_t>(samples.size() * 2);
    file.write("RIFF", 4), put(36 + size, 4), file.write("WAVEfmt ", 8);
    put(16, 4), put(1, 2), put(channels, 2), put(rate, 4), put(rate * channels * 2, 4);
    put(channels * 2U, 2), put(16, 2), file.write("data", 4), put(size, 4);
    std::string bytes;
    bytes.reserve(size);
    for (const float sample : samples) {
        const auto value = static_cast<std::int16_t>(std::lround(std::clamp(sample, -1.0F, 1.0F) * 32767));
        bytes.push_back(static_cast<char>(value & 0xFF));
        bytes.push_back(static_cast<char>(value >> 8));
    }
    file.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
}

}  // namespace qvct::bench
