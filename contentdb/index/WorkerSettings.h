#pragma once

#include <string>
#include <string_view>

namespace qvct::contentdb {

/// The settings of this process that its workers take over: the files that replace resources.
std::string encodedWorkerSettings();
/// Sets the same in this process. To be called before anything reads a resource.
void applyWorkerSettings(std::string_view settings);

}  // namespace qvct::contentdb
