// Whatever the bytes: no read outside of them; a found trailer lies within, and none lies before it; a found
// list parses, or fails, without harm.

#include "ExactInput.h"
#include "formats/settings/CFBinaryPlistFindTrailer.h"
#include "formats/settings/TGRTBinaryFileMetaDataReader.h"

using namespace qvct;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const fuzz::ExactInput input(data, size);
    std::uint64_t position = 0;
    if (CFBinaryPlistFindTrailer(input.bytes().data(), size, &position)) {
        fuzz::require(position + kBinaryPlistTrailerLength <= size);
        for (std::size_t i = 0; i < 5; ++i) fuzz::require(input.bytes()[position + i] == 0);
        // A shorter length only makes the test stricter: none may turn up before the first one.
        std::uint64_t again = 0;
        fuzz::require(!CFBinaryPlistFindTrailer(input.bytes().data(), position + 31, &again));
    }
    const auto found = findEmbeddedPropertyList(input.bytes());
    fuzz::require(!found || found->offset + found->length <= size);
    return 0;
}
