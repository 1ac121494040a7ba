#include "metadata/QVCTUUIDGenerator.h"

#include "platform/text/Url.h"

#include <array>

#include <uuid/uuid.h>

namespace qvct {

std::string QVCTUUIDGenerator::automaticUUIDForAbsolutePath(std::string_view path) {
    const std::string normal = URL::fileURLWithPath("/" + std::string(path)).path();
    uuid_t space;
    uuid_parse(kPathNamespace.data(), space);
    uuid_t identifier;
    uuid_generate_sha1(identifier, space, normal.data(), normal.size());
    std::array<char, UUID_STR_LEN> text{};
    uuid_unparse_lower(identifier, text.data());
    return text.data();
}

}  // namespace qvct
