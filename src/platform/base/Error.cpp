#include "platform/base/Error.h"

#include <utility>

namespace qvct {

bool fail(Error* error, ErrorCode code, std::string message) {
    if (error != nullptr) *error = Error{std::string(QVCTErrorDomain), code, std::move(message)};
    return false;
}

}  // namespace qvct
