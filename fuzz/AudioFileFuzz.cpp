// Any bytes as an audio file: decoding and the search for onsets end, within memory that the file cannot
// choose.
#include "platform/AudioDecoder.h"
#include "platform/OnsetDetector.h"

#include <algorithm>
#include <memory>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::unique_ptr<std::uint8_t[]> exact(
        new std::uint8_t[size]);  // so that reading past the end shows
    std::copy(data, data + size, exact.get());
    if (const auto decoder = qvct::AudioDecoder::open(std::span<const std::uint8_t>(exact.get(), size))) {
        qvct::OnsetDetector::detect(*decoder);
    }
    return 0;
}
