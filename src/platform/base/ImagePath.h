#pragma once

#include <filesystem>

namespace qvct {

/// The file that the code at this address was loaded from: a shared library, or the program. Links are
/// followed; empty when the system does not know.
std::filesystem::path imagePath(const void* code);

}  // namespace qvct
