#pragma once

#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::tool {

/// Every tag whose label holds the text, without regard to case and diacritics, in the taxonomy's order.
std::vector<std::shared_ptr<TGRTTag>> tagsHolding(std::string_view text,
                                                  const std::shared_ptr<TGRTTaxonomy>& taxonomy);
/// For a message that there is no such tag: "; there are: Genres/House, ...", as `--add` takes them, or else
/// "; did you mean \"Source/Kick\"?" where one is spelt nearly so. Empty when there are none.
std::string similarTags(std::string_view label, const std::shared_ptr<TGRTTaxonomy>& taxonomy);

}  // namespace qvct::tool
