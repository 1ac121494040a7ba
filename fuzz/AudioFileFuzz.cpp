// Any bytes as an audio file: decoding and the search for onsets end, within memory that the file cannot
// choose.
#include "ExactInput.h"
#include "listening/onsets/OnsetDetector.h"
#include "media/audio/AudioDecoder.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const qvct::fuzz::ExactInput input(data, size);
    if (const auto decoder = qvct::AudioDecoder::open(input.bytes())) {
        qvct::OnsetDetector::detect(*decoder);
    }
    return 0;
}
