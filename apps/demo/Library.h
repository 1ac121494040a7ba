#pragma once

#include "demo/synthesis/Recipes.h"

#include <string>
#include <string_view>
#include <vector>

/// A small library of sounds and patches, named and filed as a producer would.
namespace qvct::demo {

struct AudioItem {
    std::string_view path;
    Recipe recipe;
    AudioFormat format;
};

const std::vector<AudioItem>& audioItems();

/// The item's sound, named after its file.
Sound sound(const AudioItem& item);

/// Writes the whole library below a folder; the same bytes on every run. Files that lie there under the same
/// names are replaced, others stay.
///
/// @return  The paths of the items, relative to the folder; a bundle is one item.
/// Throws std::system_error naming the path that cannot be written; what was written before stays.
std::vector<std::string> writeLibrary(const std::string& folder);

}  // namespace qvct::demo
