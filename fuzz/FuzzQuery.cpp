// Any text is a query or a fault inside it; a query evaluates the same each time, and its negation to the
// opposite.

#include "ExactInput.h"
#include "contentdb/Query.h"

#include <cstdint>

using namespace qvct::contentdb;
using qvct::fuzz::require;

namespace {

IndexedItem item() {
    IndexedItem result;
    result.name = "Dusty Caf\xc3\xa9 120bpm";
    result.path = "/Music/Deep House/Dusty.wav";
    result.taggings = {{"Deep House", "Genres", {"House"}, 0.6F, Provenance::stored, {}}};
    result.values = {{"Tempo", 120.0}};
    result.likeness = "heard";  // no query of a sound passes it over
    return result;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t longest = 4096;
    if (size > longest) return 0;
    const qvct::fuzz::ExactInput input(data, size);
    const Vocabulary vocabulary = {{"Genres", "Sound Descriptors"}, {"BeatCount"}};
    static const IndexedItem known = item();
    QueryError error;
    const auto query = parseQuery(input.text(), vocabulary, &error);
    if (!query) {
        require(!error.message.empty() && error.position <= size && error.length <= size - error.position);
        return 0;
    }
    const bool isFound = matches(*query, known);
    require(isFound == matches(*query, known));
    require(!comesBefore(*query, known, known));
    Query inverse;
    inverse.condition = {NoneOf{{query->condition}}};
    require(matches(inverse, known) != isFound);
    return 0;
}
