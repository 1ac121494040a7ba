#pragma once

#include "platform/base/Export.h"

#include <string>
#include <string_view>

namespace qvct {

/// Domain of the errors that the framework makes itself.
inline constexpr std::string_view QVCTErrorDomain = "QVContentTagging Error Domain";

/// Why something failed: where the fault belongs (domain, code) and a message for people that names the
/// thing, the place (path, byte offset, line) and the reason.
///
/// Operations that can fail take an `Error*` as their last argument; null means that the caller does not ask.
/// The error is written only on failure.
struct Error {
    std::string domain;
    int code = 0;
    std::string message;
};

/// Codes used in QVCTErrorDomain.
enum ErrorCode : int {
    kErrorUnreadable = 1,       ///< A file or folder cannot be opened or read.
    kErrorNoPropertyList = 2,   ///< A data file's embedded property list cannot be extracted.
    kErrorMalformed = 3,        ///< The bytes are not what their format demands.
    kErrorTooLarge = 4,         ///< A limit on size, depth or count was exceeded.
    kErrorUnwritable = 5,       ///< A file cannot be written or replaced.
    kErrorInvalidArgument = 6,  ///< The caller asked for something that cannot be.
    kErrorNoContent = 7         ///< What lies there is no content of a kind that the framework knows.
};

/// Fills `error`, if asked for, with a framework error. Always false, so that a failing operation can
/// `return fail(error, ...)`.
QVCT_API bool fail(Error* error, ErrorCode code, std::string message);

}  // namespace qvct
