#pragma once

#include <filesystem>

namespace qvct {

/// The file that the code at this address was loaded from: a shared library, or the program. Links followed;
/// empty when the system does not tell.
std::filesystem::path imagePath(const void* code);

}  // namespace qvct
