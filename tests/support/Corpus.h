#pragma once

#include "support/Places.h"

#include <algorithm>
#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include <gtest/gtest.h>

namespace qvct::test {

/// Real files that are never part of the project; tests that want them skip where they are absent.
inline std::filesystem::path corpus(std::string_view folder) {
    return std::filesystem::path(QVCT_CORPUS) / folder;
}

/// The regular files below a folder, in the order of their paths.
inline std::vector<std::string> filesBelow(const std::filesystem::path& folder) {
    std::vector<std::string> files;
    if (!std::filesystem::is_directory(folder)) return files;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(folder)) {
        if (entry.is_regular_file()) files.push_back(entry.path().string());
    }
    std::sort(files.begin(), files.end());
    return files;
}

#define QVCT_SKIP_WITHOUT(folder) \
    if (!std::filesystem::is_directory(folder)) GTEST_SKIP() << "no such folder: " << (folder)

}  // namespace qvct::test
