#pragma once

#include "metadata/TGRTSettingsInfo.h"
#include "platform/base/Error.h"
#include "platform/text/Url.h"

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>

namespace qvct {

/// Reads the 24 bytes with which a plug-in settings file begins (docs/formats/settings-files.md).
class TGRTSettingsHeaderReader {
  public:
    static constexpr std::size_t kHeaderLength = 24;

    /// Which plug-in the file belongs to. Bytes that a shorter file does not have count as zero. Null without
    /// URL, and with an error for what cannot be read.
    static std::shared_ptr<TGRTSettingsInfo> settingInfoForURL(const std::optional<URL>& url,
                                                               Error* error = nullptr);
    /// The same from the first bytes of a file.
    static std::shared_ptr<TGRTSettingsInfo> settingInfoForBytes(std::span<const std::uint8_t> bytes);

    /// Copies a header into little-endian order; whether that took swapping.
    ///
    /// The flag at offset 6 decides together with the manufacturer at offset 12: a known one ("CLEM" or
    /// "MELC") with the flag set, or an unknown one with it clear, stands as it is; otherwise all fields but
    /// flag and sub ID are swapped, and the flag is cleared.
    static bool _swapHeaderFromSrc(std::span<const std::uint8_t, kHeaderLength> source,
                                   std::span<std::uint8_t, kHeaderLength> destination);
};

}  // namespace qvct
