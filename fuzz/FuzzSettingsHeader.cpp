// Whatever the bytes: no crash; a swap is its own inverse but for the flag; a normalised header reads as the
// stored one.

#include "ExactInput.h"
#include "formats/settings/TGRTSettingsHeaderReader.h"

#include <algorithm>
#include <array>

using namespace qvct;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t length = TGRTSettingsHeaderReader::kHeaderLength;
    constexpr std::size_t flag = 6;
    const fuzz::ExactInput input(data, size);
    const auto info = TGRTSettingsHeaderReader::settingInfoForBytes(input.bytes());
    std::array<std::uint8_t, length> stored{};
    std::copy_n(input.bytes().begin(), std::min(size, length), stored.begin());
    std::array<std::uint8_t, length> header{};
    const bool swapped = TGRTSettingsHeaderReader::_swapHeaderFromSrc(stored, header);
    fuzz::require(swapped || header == stored);
    fuzz::require(!swapped || header[flag] == 0);
    fuzz::require((info->plugInID() & 0xFFU) == header[20] && info->plugInID() >> 24U == header[23]);
    if (!swapped) return 0;
    for (const auto& [first, last] : {std::pair{0, 4}, {4, 6}, {8, 12}, {12, 16}, {16, 20}, {20, 24}})
        std::reverse(header.begin() + first, header.begin() + last);
    header[flag] = stored[flag];
    fuzz::require(header == stored);
    return 0;
}
