#include "formats/settings/TGRTSettingsHeaderReader.h"

#include "platform/base/bytes/ByteOrder.h"
#include "platform/base/bytes/SwapData.h"
#include "platform/files/reading/RandomAccessReader.h"

#include <algorithm>
#include <array>

namespace qvct {
namespace {

constexpr std::size_t kFlagOffset = 6;
constexpr std::size_t kSubIdentifierOffset = 7;
constexpr std::size_t kManufacturerOffset = 12;
constexpr std::size_t kProductOffset = 16;
constexpr std::size_t kPlugInOffset = 20;

std::uint32_t littleEndian(std::span<const std::uint8_t> bytes, std::size_t offset) {
    return static_cast<std::uint32_t>(numberOf(bytes.subspan(offset, 4), ByteOrder::little));
}

}  // namespace

bool TGRTSettingsHeaderReader::_swapHeaderFromSrc(std::span<const std::uint8_t, kHeaderLength> source,
                                                  std::span<std::uint8_t, kHeaderLength> destination) {
    constexpr std::uint32_t known = 0x4D454C43;
    constexpr std::uint32_t knownSwapped = 0x434C454D;
    constexpr std::array<int, 8> fields = {4, 2, -2, 4, 4, 4, 4, 0};
    const std::uint32_t manufacturer = littleEndian(source, kManufacturerOffset);
    const bool isKnown = manufacturer == known || manufacturer == knownSwapped;
    const bool hasFlag = source[kFlagOffset] != 0;
    if (isKnown == hasFlag) {
        std::copy(source.begin(), source.end(), destination.begin());
        return false;
    }
    SwapData(source, destination, fields);
    destination[kFlagOffset] = 0;
    return true;
}

std::shared_ptr<TGRTSettingsInfo> TGRTSettingsHeaderReader::settingInfoForBytes(
    std::span<const std::uint8_t> bytes) {
    std::array<std::uint8_t, kHeaderLength> stored{};
    std::array<std::uint8_t, kHeaderLength> header{};
    std::copy_n(bytes.begin(), std::min(bytes.size(), stored.size()), stored.begin());
    _swapHeaderFromSrc(stored, header);
    auto info = std::make_shared<TGRTSettingsInfo>();
    info->setManuID(littleEndian(header, kManufacturerOffset));
    info->setPlugInSubID(static_cast<std::uint32_t>(static_cast<std::int8_t>(header[kSubIdentifierOffset])));
    info->setPlugInID(littleEndian(header, kPlugInOffset));
    info->setProductID(littleEndian(header, kProductOffset));
    return info;
}

std::shared_ptr<TGRTSettingsInfo> TGRTSettingsHeaderReader::settingInfoForURL(const std::optional<URL>& url,
                                                                              Error* error) {
    if (!url) return nullptr;
    const auto reader = FileReader::open(url->path(), error);
    if (!reader) return nullptr;
    std::array<std::uint8_t, kHeaderLength> bytes{};
    const auto stored = std::span(bytes).first(std::min<std::uint64_t>(reader->size(), kHeaderLength));
    if (!reader->read(0, stored)) {
        fail(error, kErrorUnreadable, "cannot be read", {url->path()});
        return nullptr;
    }
    return settingInfoForBytes(stored);
}

}  // namespace qvct
