#pragma once

#include "platform/base/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace qvct {

/// Domain of the framework's own errors.
inline constexpr std::string_view QVCTErrorDomain = "QVContentTagging Error Domain";

/// Where something is wrong; what is not known of it is empty.
struct ErrorPlace {
    std::string path = {};                     ///< The file or folder, or a URL of no file.
    std::string part = {};                     ///< Its part; without a path, the thing: "XML property list".
    std::optional<std::uint64_t> line = {};    ///< The line, from 1.
    std::optional<std::uint64_t> offset = {};  ///< The byte, from 0 at the start of the file.
};

/// Why something failed: the kind of fault (domain, code), the place and the reason as separate fields.
///
/// Operations that can fail take an `Error*` as their last argument; null means that the caller does not ask.
/// The error is written only on failure.
struct QVCT_API Error : ErrorPlace {
    std::string domain;
    int code = 0;
    std::string reason;  ///< For people, without the place: "is not UTF-8 text".

    /// Whether a failing operation has filled it in.
    bool isSet() const { return !reason.empty(); }

    /// The message for people, on one line: "PATH: PART, line LINE, byte OFFSET: REASON". What is unknown is
    /// left out, what cannot be printed is escaped.
    std::string message() const;
};

/// Codes used in QVCTErrorDomain.
enum ErrorCode : int {
    kErrorUnreadable = 1,       ///< A file or folder cannot be opened or read.
    kErrorNoPropertyList = 2,   ///< A data file's embedded property list cannot be extracted.
    kErrorMalformed = 3,        ///< The bytes are not what their format demands.
    kErrorTooLarge = 4,         ///< A limit on size, depth or count was exceeded.
    kErrorUnwritable = 5,       ///< A file cannot be written or replaced.
    kErrorInvalidArgument = 6,  ///< The caller asked for something impossible.
    kErrorNoContent = 7         ///< Not content of any kind that the framework knows.
};

/// A framework error.
QVCT_API Error errorOf(ErrorCode code, std::string reason, ErrorPlace place = {});

/// Fills `error`, if asked for, with a framework error. Always false, so that a failing operation can
/// `return fail(error, ...)`.
QVCT_API bool fail(Error* error, ErrorCode code, std::string reason, ErrorPlace place = {});

/// Adds the path to an error that lacks it, as when the failing operation was only given a file's bytes.
/// Always false, as above.
QVCT_API bool failIn(std::string_view path, Error* error);

}  // namespace qvct
