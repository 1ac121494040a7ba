#pragma once

#include "platform/base/Export.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

// Reads the markers that raw tag labels carry: "Bright / Dark-+", "Distortion[Light,Heavy]", "Tempo$5",
// "Loudness%", "Featured!", and the sorting prefix "2^".

/// What kind of value a tag takes, as its raw label says.
enum TagValueType : std::int64_t {
    kTagValuePlain = 0,
    kTagValuePercentage = 1,  ///< "%"
    kTagValueBipolar = 2,     ///< "-+", or named steps in braces
    kTagValueStepped = 3,     ///< "$5", or named steps in brackets
    kTagValueFlag = 4         ///< "!"
};

/// The label for people: without markers, prefix and step names. Blanks stay.
QVCT_API std::string normalizedTagString(std::string_view raw);
/// What kind of value the raw label asks for.
QVCT_API TagValueType tagValueType(std::string_view raw);
/// The number behind "$", else how many steps are named.
QVCT_API std::int64_t numberOfTagValueSteps(std::string_view raw);
/// The named steps, blanks kept, or the two poles of a bipolar label; nothing when there are none.
QVCT_API std::optional<std::vector<std::string>> tagStepLabels(std::string_view raw);

/// Splits what people write, "Warm (0.75)", into the label and, through `level`, the weight in parentheses
/// (nothing when there is none).
QVCT_API std::string labelFromString(std::string_view text, std::optional<double>* level = nullptr);

/// The identifier of content that is named by a text: the text itself.
inline std::string contentUUID(std::string_view text) {
    return std::string(text);
}

}  // namespace qvct
