#pragma once

#include "demo/files/PatchDescription.h"

namespace qvct::demo {

struct PatchItem {
    std::string_view path;
    Compression compression;
    std::vector<Channel> channels;
};

/// Patch bundles that between them hold something for every rule that looks into a patch.
const std::vector<PatchItem>& patches();

/// The cache of a settings file: one channel, without the bundle round it.
const std::vector<PatchItem>& settingsWithCaches();

}  // namespace qvct::demo
