// Any bytes are habits and weights that names can be read by, or have a fault on one of their lines.

#include "SoundReading.h"
#include "platform/data/PropertyListFile.h"
#include "platform/data/propertylist/PropertyListPlace.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomy.h"

using namespace qvct;

namespace {

void requirePlace(std::span<const std::uint8_t> bytes, std::string_view text, const PropertyListPath& place,
                  const Error& error) {
    fuzz::require(error.isSet() && !error.part.empty() && !place.empty());
    const auto line = lineOfValue(bytes, place);
    // A list in UTF-16 has fewer lines than line breaks among its bytes.
    fuzz::require(!line || (*line >= 1 && *line <= lineAt(text, text.size())));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t longest = 8192;
    if (size > longest) return 0;
    const fuzz::ExactInput input(data, size);
    const auto list = parsePropertyList(input.bytes());
    const PropertyList::Dictionary* dictionary = list ? list->dictionary() : nullptr;
    if (dictionary == nullptr) return 0;
    Error error;
    const auto weights = EvidenceWeights::weightsWithDictionary(*dictionary, &error);
    fuzz::require(weights.has_value() != error.isSet());
    PropertyListPath place;
    error = {};
    const auto habits =
        NamingHabits::initWithDictionaries({dictionary, 1}, *TGRTTaxonomy::defaultTaxonomy(), &error, &place);
    if (!habits) {
        requirePlace(input.bytes(), input.text(), place, error);
        return 0;
    }
    static const EvidenceWeights builtIn = EvidenceWeights::defaultWeights();
    NameReader reader(habits, weights.value_or(builtIn));
    const std::string_view names[] = {"Deep_House 01 kickroll (Am) 124bpm", "Hard Drive Vol 2", input.text()};
    fuzz::requireSoundReading(reader, names);
    return 0;
}
