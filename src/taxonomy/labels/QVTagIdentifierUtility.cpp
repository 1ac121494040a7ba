#include "taxonomy/labels/QVTagIdentifierUtility.h"

#include <fmt/format.h>

namespace qvct {

std::string QVTagIdentifierUtility::localizationKeyForJingJangTagLabel(std::string_view label,
                                                                       bool lowerValue) {
    return fmt::format("{}_{}", label, lowerValue ? "lowerPole" : "upperPole");
}

}  // namespace qvct
