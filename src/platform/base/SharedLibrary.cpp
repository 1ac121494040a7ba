#include "platform/base/SharedLibrary.h"

#include <dlfcn.h>
#include <fmt/format.h>

namespace qvct {

std::optional<SharedLibrary> SharedLibrary::load(const std::string& name, Error* error) {
    // Its symbols stay local, since the host may have loaded another version of the library.
    if (void* handle = ::dlopen(name.c_str(), RTLD_LAZY | RTLD_LOCAL)) return SharedLibrary(name, handle);
    const char* reason = ::dlerror();  // names the library itself
    fail(error, kErrorUnreadable, reason == nullptr ? name + " cannot be loaded" : reason);
    return std::nullopt;
}

void* SharedLibrary::address(const char* name, Error* error) const {
    void* found = ::dlsym(handle_, name);
    if (found == nullptr) fail(error, kErrorUnreadable, fmt::format("has no function {}", name), {name_});
    return found;
}

}  // namespace qvct
