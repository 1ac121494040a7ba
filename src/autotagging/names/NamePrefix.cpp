#include "autotagging/names/NamePrefix.h"

#include <algorithm>
#include <array>

namespace qvct {
namespace {

bool isCapital(char c) {
    return c >= 'A' && c <= 'Z';
}

bool isSmall(char c) {
    return c >= 'a' && c <= 'z';
}

}  // namespace

std::optional<NamePrefix> namePrefixOf(std::string_view name) {
    const auto* const behindCapitals = std::find_if_not(name.begin(), name.end(), isCapital);
    const auto* const behind = std::find_if_not(behindCapitals, name.end(), isSmall);
    if (behindCapitals - name.begin() < 2 || (behind != name.end() && *behind != '_' && *behind != '-'))
        return std::nullopt;
    NamePrefix prefix{std::string_view(name.begin(), behind), {}};
    std::array<std::size_t, 4> ends{};  // of the four parts
    std::size_t end = prefix.code.size();
    for (std::size_t& each : ends) {
        end = std::min(name.find('_', end), name.size());
        each = end;
        if (end < name.size()) ++end;
    }
    const bool isWhole = ends[2] < name.size();
    if (behind == behindCapitals && !isWhole) return std::nullopt;
    if (ends[1] < name.size())
        prefix.makers = {static_cast<std::uint32_t>(ends[1] + 1), static_cast<std::uint32_t>(ends[3])};
    return prefix;
}

}  // namespace qvct
