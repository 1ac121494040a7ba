#include "platform/base/Error.h"

#include "platform/base/bytes/Printable.h"

#include <utility>

namespace qvct {
namespace {

void append(std::string& text, std::string_view separator, std::string_view more) {
    if (!text.empty()) text += separator;
    text += more;
}

}  // namespace

std::string Error::message() const {
    std::string text = printable(path);
    const char* separator = ": ";
    const auto addPlace = [&](std::string_view place) {
        append(text, std::exchange(separator, ", "), place);
    };
    if (!part.empty()) addPlace(printable(part));
    if (line) addPlace("line " + std::to_string(*line));
    if (offset) addPlace("byte " + std::to_string(*offset));
    if (!reason.empty()) append(text, ": ", printable(reason));
    return text;
}

Error errorOf(ErrorCode code, std::string reason, ErrorPlace place) {
    return {std::move(place), std::string(QVCTErrorDomain), code, std::move(reason)};
}

bool fail(Error* error, ErrorCode code, std::string reason, ErrorPlace place) {
    if (error != nullptr) *error = errorOf(code, std::move(reason), std::move(place));
    return false;
}

bool failIn(std::string_view path, Error* error) {
    if (error != nullptr && error->path.empty()) error->path = path;
    return false;
}

}  // namespace qvct
