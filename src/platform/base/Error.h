#pragma once

#include "platform/base/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// Domain of the errors that the framework makes itself.
inline constexpr std::string_view QVCTErrorDomain = "QVContentTagging Error Domain";

/// Where something is wrong; what is not known of it is empty.
struct ErrorPlace {
    std::string path = {};                     ///< The file or folder, or the address that is none.
    std::string part = {};                     ///< What in it or, without a path, what: "XML property list".
    std::optional<std::uint64_t> line = {};    ///< The line, from 1.
    std::optional<std::uint64_t> offset = {};  ///< The byte, from 0 at the start of the file.
};

/// Why something failed: the kind of fault (domain, code), the place and the reason, each for itself.
///
/// Operations that can fail take an `Error*` as their last argument; null means that the caller does not ask.
/// The error is written only on failure.
struct QVCT_API Error : ErrorPlace {
    std::string domain;
    int code = 0;
    std::string reason;  ///< For people, without the place: "is not UTF-8 text".

    /// Whether a failing operation has written it.
    bool isSet() const { return !reason.empty(); }

    /// The sentence for people, fit for one line: "PATH: PART, line LINE, byte OFFSET: REASON" without what
    /// is unknown; what cannot be printed is escaped.
    std::string message() const;
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

/// A framework error.
QVCT_API Error errorOf(ErrorCode code, std::string reason, ErrorPlace place = {});

/// Fills `error`, if asked for, with a framework error. Always false, so that a failing operation can
/// `return fail(error, ...)`.
QVCT_API bool fail(Error* error, ErrorCode code, std::string reason, ErrorPlace place = {});

/// Adds the path to an error of which only the path is unknown, as when bytes were read that are some file's.
/// Always false, as above.
QVCT_API bool failIn(std::string_view path, Error* error);

}  // namespace qvct
