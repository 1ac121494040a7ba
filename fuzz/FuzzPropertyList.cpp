// Whatever the bytes: no crash, and what can be read survives being written and read in both encodings.

#include "ExactInput.h"
#include "platform/PropertyListFile.h"

using namespace qvct;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const fuzz::ExactInput input(data, size);
    const auto value = parsePropertyList(input.bytes());
    if (!value) return 0;
    const std::string binary = serializePropertyList(*value, PropertyListFormat::binary);
    if (binary.empty()) return 0;  // holds a text with a NUL character
    const auto again = parsePropertyList(binary);
    fuzz::require(again.has_value());
    fuzz::require(serializePropertyList(*again, PropertyListFormat::binary) == binary);
    const std::string xml = serializePropertyList(*value, PropertyListFormat::xml);
    fuzz::require(!xml.empty());
    return 0;
}
