// Any bytes are a name, and a path of names: what is read in them stands there.

#include "SoundReading.h"
#include "autotagging/names/ItemNames.h"

using namespace qvct;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::size_t longest = 16384;
    if (size > longest) return 0;
    const fuzz::ExactInput input(data, size);
    static NameReader reader;
    const std::string_view name[] = {input.text()};
    fuzz::requireSoundReading(reader, name);
    const ItemNames names("/" + std::string(input.text()), "/");
    fuzz::requireSoundReading(reader, names.all());
    return 0;
}
