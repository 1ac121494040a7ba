#include "platform/data/propertylist/PropertyListPlace.h"

#include "platform/data/propertylist/OldStylePropertyList.h"
#include "platform/data/propertylist/PropertyListEncoding.h"
#include "platform/data/propertylist/XmlPropertyListReader.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"

#include <utility>

namespace qvct {

std::optional<std::uint64_t> lineOfValue(std::span<const std::uint8_t> bytes, PropertyListPath path) {
    PropertyListFault fault;
    if (isBinaryPropertyList(bytes)) return std::nullopt;
    const auto characters = PropertyListCharacters::decode(bytes, fault);
    if (!characters) return std::nullopt;
    const std::string_view text = characters->text();
    PropertyListPlace place{std::move(path), std::nullopt};
    for (; !place.path.empty(); place.path.pop_back()) {
        std::size_t end = 0;
        const bool isRead = isXmlPropertyList(text)
                                ? parseXmlPropertyList(text, end, fault, &place).has_value()
                                : parseOldStylePropertyList(text, fault, &place).has_value();
        if (isRead && place.offset) return lineAt(text, *place.offset);
    }
    return std::nullopt;
}

bool failAtValue(Error* error, ErrorCode code, std::string reason, const PropertyListPath& path) {
    std::vector<std::string> keys;
    for (const auto& step : path)
        if (const auto* key = std::get_if<std::string>(&step)) keys.push_back(*key);
    return fail(error, code, std::move(reason), {.part = join(keys, ", ")});
}

bool failInFile(const std::string& file, const PropertyListPath& path, Error* error) {
    if (error == nullptr) return false;
    if (const auto bytes = readFile(file)) error->line = lineOfValue(*bytes, path);
    return failIn(file, error);
}

}  // namespace qvct
