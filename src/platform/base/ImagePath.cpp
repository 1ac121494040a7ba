#include "platform/base/ImagePath.h"

#include <system_error>

#include <dlfcn.h>
#include <link.h>

namespace qvct {

std::filesystem::path imagePath(const void* code) {
    Dl_info image{};
    link_map* map = nullptr;
    if (::dladdr1(code, &image, reinterpret_cast<void**>(&map), RTLD_DL_LINKMAP) == 0) return {};
    const bool isProgram = *map->l_name == '\0';
    std::error_code ignored;
    return std::filesystem::canonical(isProgram ? "/proc/self/exe" : map->l_name, ignored);
}

}  // namespace qvct
