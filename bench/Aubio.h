#pragma once

#include <cstdio>
#include <cstdlib>
#include <optional>
#include <string>
#include <vector>

namespace qvct::bench {

/// Onsets in seconds as the program aubioonset finds them with its defaults; nothing when it is not
/// installed.
inline std::optional<std::vector<double>> aubioOnsets(const std::string& path) {
    std::FILE* pipe = ::popen(("aubioonset -i '" + path + "' 2>/dev/null").c_str(), "r");
    if (!pipe) return std::nullopt;
    std::vector<double> onsets;
    double seconds = 0;
    while (std::fscanf(pipe, "%lf", &seconds) == 1) onsets.push_back(seconds);
    return ::pclose(pipe) == 0 ? std::optional(onsets) : std::nullopt;
}

}  // namespace qvct::bench
