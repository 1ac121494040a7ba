#include "platform/base/Version.h"

namespace qvct {

std::string_view version() {
    return QVCT_VERSION;
}

}  // namespace qvct
