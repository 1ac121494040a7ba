#include "platform/base/bytes/SwapData.h"

#include <algorithm>

namespace qvct {

void SwapData(std::span<const std::uint8_t> source, std::span<std::uint8_t> destination,
              std::span<const int> fieldSizes) {
    const std::size_t size = std::min(source.size(), destination.size());
    if (source.data() != destination.data()) std::copy_n(source.begin(), size, destination.begin());
    std::span<std::uint8_t> rest = destination.first(size);
    for (const int field : fieldSizes) {
        const auto width = static_cast<std::size_t>(field < 0 ? -static_cast<std::int64_t>(field) : field);
        if (width == 0 || width > rest.size()) return;
        if (field > 0) std::reverse(rest.begin(), rest.begin() + field);
        rest = rest.subspan(width);
    }
}

}  // namespace qvct
