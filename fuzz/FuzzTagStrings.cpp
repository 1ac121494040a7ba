// Whatever the label: no crash, and a tag written with its marker is read as the same kind of tag.

#include "ExactInput.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTCategory.h"
#include "taxonomy/TGRTTag.h"

#include <cmath>

using namespace qvct;

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const fuzz::ExactInput input(data, size);
    if (!isValidUtf8(input.text())) return 0;
    std::optional<double> level;
    const std::string label = labelFromString(input.text(), &level);
    fuzz::require(label.size() <= size && (!level || std::isfinite(*level)));
    const auto tag = TGRTTag::initWithLabel(input.text(), nullptr, nullptr);
    fuzz::require(tag->label().size() <= size && tag->numberOfTagValueSteps() >= 0);
    fuzz::require(tag->valueStepLabels().size() <= size + 1);
    // Steps with brackets in them, and labels with more than one marker, do not come back the same.
    if (input.text().find_first_of("[]{}$^%!+\r\n\xe2\xc2") != std::string_view::npos) return 0;
    const auto again = TGRTTag::initWithLabel(tag->serializedLabel(), nullptr, nullptr);
    fuzz::require(again->label() == tag->label() && again->valueType() == tag->valueType());
    return 0;
}
