// Any bytes as an audio file: decoding and the search for onsets end, within memory that the file cannot
// choose.
#include "listening/onsets/OnsetDetector.h"
#include "media/audio/AudioDecoder.h"
#include "platform/files/reading/RandomAccessReader.h"

#include <memory>
#include <span>
#include <utility>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    auto file = std::make_shared<qvct::MemoryReader>(std::span(data, size));
    if (const auto decoder = qvct::AudioDecoder::open(std::move(file), "input")) {
        qvct::OnsetDetector::detect(*decoder);
    }
    return 0;
}
