// Whatever the bytes: no crash, and what can be read survives being written and read in both encodings.

#include "ExactInput.h"
#include "platform/data/PropertyListFile.h"

using namespace qvct;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const fuzz::ExactInput input(data, size);
    const auto value = parsePropertyList(input.bytes());
    if (!value) return 0;
    const std::string binary = serializePropertyList(*value, PropertyListFormat::binary);
    if (binary.empty()) return 0;  // holds a text with a NUL character
    const auto again = parsePropertyList(binary);
    fuzz::require(again.has_value());
    const std::string xml = serializePropertyList(*value, PropertyListFormat::xml);
    // Compared as XML, since the same value has several binary forms: equal parts are written once or twice.
    fuzz::require(serializePropertyList(*again, PropertyListFormat::xml) == xml);
    if (xml.empty()) return 0;  // holds a character that XML forbids
    const auto fromXml = parsePropertyList(xml);
    fuzz::require(fromXml.has_value());
    fuzz::require(serializePropertyList(*fromXml, PropertyListFormat::xml) == xml);
    return 0;
}
