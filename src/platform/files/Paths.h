#pragma once

#include <string>
#include <string_view>

namespace qvct {

/// The path of what lies in a folder under a name. The root folder is "/".
inline std::string pathIn(std::string_view folder, std::string_view name) {
    std::string path(folder == "/" ? std::string_view() : folder);
    path += '/';
    path += name;
    return path;
}

}  // namespace qvct
